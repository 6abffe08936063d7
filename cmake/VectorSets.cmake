# The instruction sets that every _vector.cpp is compiled for, each into an object library of its
# own, which is part of the module's core. The macro makes imageutility/kernels/Vector.h choose.

# kyv_vector_set(NAME OPTION...): one set, and the options that let the compiler use it.
function(kyv_vector_set name)
    set(library kyv_kernels_${name})
    add_library(${library} OBJECT)
    kyv_target(${library})
    string(TOUPPER ${name} macro)
    target_compile_definitions(${library} PRIVATE KYV_VECTOR_SET_${macro})
    target_compile_options(${library} PRIVATE ${ARGN})
    target_sources(kyvdsp_core PRIVATE $<TARGET_OBJECTS:${library}>)
    set(KYV_VECTOR_SETS ${KYV_VECTOR_SETS} ${name} PARENT_SCOPE)
endfunction()

set(KYV_VECTOR_SETS)
if(NOT KYV_VECTOR_KERNELS)
    return()
endif()
if(CMAKE_SYSTEM_PROCESSOR MATCHES "^(x86_64|AMD64)$")
    kyv_vector_set(sse2)
    kyv_vector_set(ssse3 -mssse3)
    kyv_vector_set(avx2 -mavx2)
    kyv_vector_set(avx512 -mavx512f -mavx512bw -mavx512dq -mavx512vl)
    if(CMAKE_CXX_COMPILER_ID STREQUAL GNU)
        # GCC 12 warns of values that its own header leaves open on purpose.
        target_compile_options(kyv_kernels_avx512 PRIVATE -Wno-uninitialized
                               -Wno-maybe-uninitialized)
    endif()
elseif(CMAKE_SYSTEM_PROCESSOR STREQUAL "aarch64")
    kyv_vector_set(neon)
endif()
