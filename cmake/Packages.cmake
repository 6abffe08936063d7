# Libraries from the distribution's packages. Those that are headers only serve the Windows build
# too: they are gathered in a folder of their own, because the system's include folder as a whole
# must not reach a cross compiler.

set(KYV_HEADER_DIR ${PROJECT_BINARY_DIR}/headers)
file(MAKE_DIRECTORY ${KYV_HEADER_DIR})

function(kyv_header_package name folder package)
    if(NOT EXISTS /usr/include/${folder})
        message(FATAL_ERROR "${folder} is missing: install the package ${package}")
    endif()
    file(CREATE_LINK /usr/include/${folder} ${KYV_HEADER_DIR}/${folder} SYMBOLIC)
    add_library(${name} INTERFACE)
    target_include_directories(${name} SYSTEM INTERFACE ${KYV_HEADER_DIR})
endfunction()

kyv_header_package(kyv_cli11 CLI libcli11-dev)
kyv_header_package(kyv_json nlohmann nlohmann-json3-dev)
kyv_header_package(kyv_stb stb libstb-dev)

if(KYV_TESTS)
    set(INSTALL_GTEST OFF CACHE INTERNAL "")
    set(BUILD_GMOCK ON CACHE INTERNAL "")
    add_subdirectory(/usr/src/googletest ${PROJECT_BINARY_DIR}/googletest EXCLUDE_FROM_ALL SYSTEM)
endif()
