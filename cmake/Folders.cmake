# Where things are installed, below the prefix. On Linux the module has a folder of its own, since it
# is loaded by hosts and linked by nobody; on Windows all lies in one folder, as it is unpacked.
include(GNUInstallDirs)
if(WIN32)
    set(KYV_MODULE_FOLDER .)
    set(KYV_HEADER_FOLDER include)
    set(KYV_DATA_FOLDER share)
    set(KYV_FREI0R_FOLDER frei0r-1)
    set(KYV_PYTHON_FOLDER python)
else()
    set(KYV_MODULE_FOLDER ${CMAKE_INSTALL_LIBDIR}/kyvdsp)
    set(KYV_HEADER_FOLDER ${CMAKE_INSTALL_INCLUDEDIR}/kyvdsp)
    set(KYV_DATA_FOLDER ${CMAKE_INSTALL_DATADIR}/kyvdsp)
    set(KYV_FREI0R_FOLDER lib/frei0r-1) # where programs look, whatever the architecture
    set(KYV_PYTHON_FOLDER lib/python3/dist-packages)
endif()

# kyv_describe(TARGET DESCRIPTION): what Windows shows as the properties of the file, the version
# among it. Elsewhere nothing.
function(kyv_describe target description)
    if(NOT WIN32)
        return()
    endif()
    set(source ${PROJECT_BINARY_DIR}/versions/${target}.rc)
    configure_file(${PROJECT_SOURCE_DIR}/cmake/version.rc.in ${source} @ONLY)
    target_sources(${target} PRIVATE ${source})
endfunction()
