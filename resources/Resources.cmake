# Every picture that is embedded in the module, one row each: type, id, language, file below
# resources/art. Type PNG is a custom resource type of that name; BITMAP is the ordinary one.
# A consumer takes four items at a time:
#   while(list) list(POP_FRONT list type id language file) ...
set(KYV_RESOURCES
    PNG    141 1033 Png141.png
    PNG    142 1033 Png142.png
    PNG    143 1033 Png143.png
    PNG    145 1033 Png145.png
    BITMAP 140 1033 Bitmap140.bmp
    BITMAP 113 1028 Bitmap113.bmp
    BITMAP 101 1033 Bitmap101.bmp
    BITMAP 135 1033 Bitmap135.bmp
    BITMAP 126 1033 Bitmap126.bmp
    BITMAP 127 1033 Bitmap127.bmp
    BITMAP 128 1033 Bitmap128.bmp
    BITMAP 129 1033 Bitmap129.bmp
    BITMAP 130 1033 Bitmap130.bmp)
