// The font of contact sheets. It travels inside the program, which so needs no file at run time.
    .section .rodata
    .globl kyvhost_font
    .balign 16
kyvhost_font:
    .incbin KYV_FONT_FILE
#ifdef __ELF__
    .section .note.GNU-stack, "", %progbits
#endif
