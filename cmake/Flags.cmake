# Compiler flags of our own code, in one place.

set(CMAKE_CXX_STANDARD 20)
set(CMAKE_CXX_STANDARD_REQUIRED ON)
set(CMAKE_CXX_EXTENSIONS OFF)
set(CMAKE_C_STANDARD 11)
set(CMAKE_POSITION_INDEPENDENT_CODE ON)
set(CMAKE_CXX_VISIBILITY_PRESET hidden)
set(CMAKE_C_VISIBILITY_PRESET hidden)
set(CMAKE_VISIBILITY_INLINES_HIDDEN ON)

find_program(KYV_CCACHE ccache)
if(KYV_CCACHE)
    set(CMAKE_CXX_COMPILER_LAUNCHER ${KYV_CCACHE})
    set(CMAKE_C_COMPILER_LAUNCHER ${KYV_CCACHE})
endif()

# Directory-wide, so that the test frame built from source is instrumented like our code.
if(KYV_SANITIZE)
    add_compile_options(-fsanitize=${KYV_SANITIZE} -fno-omit-frame-pointer
                        -fno-sanitize-recover=all)
    add_link_options(-fsanitize=${KYV_SANITIZE})
endif()
if(KYV_FUZZ)
    # The fuzzer sees which branches of our code an input takes.
    add_compile_options(-fsanitize=fuzzer-no-link)
endif()
if(WIN32)
    # The product needs nothing but system libraries.
    add_link_options(-static)
    # The same sources make the same bytes.
    add_link_options(-Wl,--no-insert-timestamp)
endif()

# Pixels must have the same bytes on both targets: no contraction into fused operations.
function(kyv_target target)
    target_compile_options(${target} PRIVATE -Wall -Wextra -Wshadow -Werror -ffp-contract=off)
    target_include_directories(${target} PRIVATE ${PROJECT_SOURCE_DIR})
    if(WIN32)
        # No NOMINMAX surprises, wide entry points only.
        target_compile_definitions(${target} PRIVATE UNICODE _UNICODE NOMINMAX WIN32_LEAN_AND_MEAN)
    endif()
endfunction()

# GCC 12 sees an overlap in the joining of two strings where there is none. The second option is for
# clang-tidy, which does not know the first; GCC does not mind it.
function(kyv_string_options target)
    if(CMAKE_CXX_COMPILER_ID STREQUAL GNU)
        target_compile_options(${target} PRIVATE -Wno-restrict -Wno-unknown-warning-option)
    endif()
endfunction()

# Adds sources to a target. A _vector.cpp is a kernel's loop: it goes into the library of every
# instruction set instead, and from there into the module.
function(kyv_sources target)
    foreach(source IN LISTS ARGN)
        set(path ${CMAKE_CURRENT_SOURCE_DIR}/${source})
        if(source MATCHES "_vector\\.cpp$")
            foreach(set IN LISTS KYV_VECTOR_SETS)
                target_sources(kyv_kernels_${set} PRIVATE ${path})
            endforeach()
            continue()
        endif()
        target_sources(${target} PRIVATE ${path})
    endforeach()
endfunction()
