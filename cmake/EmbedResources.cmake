# Turns the list of resources into what the linker takes: module.rc for windres, or an assembly
# file whose table platform/posix/Resource.cpp reads. Either is made at configure time; the
# pictures are dependencies of the object.
include(${PROJECT_SOURCE_DIR}/resources/Resources.cmake)

# kyv_embed_resources(TARGET): defines a library that holds every entry of KYV_RESOURCES. On
# Windows it is an object library, which each DLL or program that is to have the resources names,
# since the linker would find no need for it otherwise. On Linux whatever uses kyv_platform has them.
function(kyv_embed_resources target)
    set(art ${PROJECT_SOURCE_DIR}/resources/art)
    set(list ${KYV_RESOURCES})
    set(files)
    set(blobs "")
    set(table "")
    set(script "#pragma code_page(65001)\n")
    while(list)
        list(POP_FRONT list type id language file)
        list(APPEND files ${art}/${file})

        math(EXPR primary "${language} & 0x3FF")
        math(EXPR sub "${language} >> 10")
        string(APPEND script "LANGUAGE ${primary}, ${sub}\n${id} ${type} \"${art}/${file}\"\n")

        # A bitmap resource is the file without its 14-byte file header.
        set(skip "")
        if(type STREQUAL "BITMAP")
            set(skip ", 14")
        endif()
        string(APPEND blobs "    .balign 16\n${type}_${id}:\n    .incbin \"${art}/${file}\"${skip}\n"
                            "${type}_${id}_end:\n")
        string(APPEND table "    .quad ${type}_name, ${type}_${id}, ${type}_${id}_end\n"
                            "    .short ${id}, ${language}\n    .long 0\n")
    endwhile()

    if(WIN32)
        set(source ${PROJECT_BINARY_DIR}/resources/module.rc)
        file(CONFIGURE OUTPUT ${source} CONTENT "${script}" @ONLY)
        add_library(${target} OBJECT ${source})
    else()
        set(source ${PROJECT_BINARY_DIR}/resources/module.S)
        file(CONFIGURE OUTPUT ${source} @ONLY CONTENT "    .section .rodata
PNG_name: .asciz \"PNG\"
BITMAP_name: .asciz \"BITMAP\"
${blobs}
    .section .data.rel.ro,\"aw\",@progbits
    .globl kyv_embedded_resources, kyv_embedded_resources_end
    .hidden kyv_embedded_resources, kyv_embedded_resources_end
    .balign 8
kyv_embedded_resources:
${table}kyv_embedded_resources_end:
    .section .note.GNU-stack,\"\",@progbits
")
        add_library(${target} STATIC ${source})
    endif()
    set_source_files_properties(${source} PROPERTIES OBJECT_DEPENDS "${files}")
endfunction()
