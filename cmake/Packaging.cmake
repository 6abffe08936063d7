# What a package holds besides the programs, and the packages: Debian packages on Linux, an archive
# for Windows. `cmake/make-packages` builds them.
include(CMakePackageConfigHelpers)
string(TIMESTAMP date "%a, %d %b %Y %H:%M:%S +0000" UTC) # of SOURCE_DATE_EPOCH, where that is set
set(made ${PROJECT_BINARY_DIR}/packaging)
set(header_folder ${KYV_HEADER_FOLDER})
set(module_file ${KYV_MODULE_FOLDER}/${CMAKE_SHARED_LIBRARY_PREFIX}KyvDsp${CMAKE_SHARED_LIBRARY_SUFFIX})
if(WIN32)
    set(module_file KyvDsp.dll)
endif()

# For makers of hosts.
configure_file(cmake/kyvdsp.pc.in ${made}/kyvdsp.pc @ONLY)
set(config_folder ${CMAKE_INSTALL_LIBDIR}/cmake/KyvDsp)
if(WIN32)
    set(config_folder cmake)
endif()
configure_package_config_file(cmake/KyvDspConfig.cmake.in ${made}/KyvDspConfig.cmake
    INSTALL_DESTINATION ${config_folder} PATH_VARS header_folder module_file)
write_basic_package_version_file(${made}/KyvDspConfigVersion.cmake COMPATIBILITY SameMajorVersion)
install(FILES ${made}/KyvDspConfig.cmake ${made}/KyvDspConfigVersion.cmake
    DESTINATION ${config_folder} COMPONENT development)
if(NOT WIN32)
    install(FILES ${made}/kyvdsp.pc DESTINATION ${CMAKE_INSTALL_LIBDIR}/pkgconfig
        COMPONENT development)
endif()

# Python, wherever the distribution's interpreter looks.
install(DIRECTORY ${PROJECT_BINARY_DIR}/bindings/python/kyvdsp DESTINATION ${KYV_PYTHON_FOLDER}
    COMPONENT python PATTERN __pycache__ EXCLUDE)

if(WIN32)
    install(FILES LICENSE NOTICE CHANGELOG.md docs/kyvhost.md docs/in-other-programs.md
            docs/python.md DESTINATION . COMPONENT module)
    set(CPACK_GENERATOR ZIP)
    set(CPACK_PACKAGE_FILE_NAME kyvdsp-${PROJECT_VERSION}-windows-x64)
else()
    install(CODE "
        file(MAKE_DIRECTORY \"\$ENV{DESTDIR}\${CMAKE_INSTALL_PREFIX}/${CMAKE_INSTALL_BINDIR}\")
        file(RELATIVE_PATH target \"/${CMAKE_INSTALL_BINDIR}\" \"/${KYV_MODULE_FOLDER}/kyvhost\")
        file(CREATE_LINK \"\${target}\"
            \"\$ENV{DESTDIR}\${CMAKE_INSTALL_PREFIX}/${CMAKE_INSTALL_BINDIR}/kyvhost\" SYMBOLIC)"
        COMPONENT module)
    install(DIRECTORY examples DESTINATION ${CMAKE_INSTALL_DATAROOTDIR}/doc/kyvdsp-dev
        COMPONENT development PATTERN __pycache__ EXCLUDE)
    install(FILES cmake/lintian-overrides DESTINATION ${CMAKE_INSTALL_DATAROOTDIR}/lintian/overrides
        COMPONENT module RENAME kyvdsp)

    set(CPACK_GENERATOR DEB)
    set(CPACK_DEB_COMPONENT_INSTALL ON)
    set(CPACK_DEBIAN_FILE_NAME DEB-DEFAULT)
    set(CPACK_DEBIAN_PACKAGE_RELEASE 1)
    if(CMAKE_SYSTEM_PROCESSOR STREQUAL aarch64)
        set(CPACK_DEBIAN_PACKAGE_ARCHITECTURE arm64)
    else()
        set(CPACK_DEBIAN_PACKAGE_ARCHITECTURE amd64)
    endif()
    set(version "(= ${PROJECT_VERSION}-${CPACK_DEBIAN_PACKAGE_RELEASE})")

    # kyv_debian(COMPONENT PACKAGE SECTION DEPENDS SUMMARY TEXT): a package, and its documents.
    function(kyv_debian component package section depends summary text)
        string(TOUPPER ${component} upper)
        set(CPACK_DEBIAN_${upper}_PACKAGE_NAME ${package} PARENT_SCOPE)
        set(CPACK_DEBIAN_${upper}_PACKAGE_SECTION ${section} PARENT_SCOPE)
        set(CPACK_DEBIAN_${upper}_PACKAGE_DEPENDS "${depends}" PARENT_SCOPE)
        set(CPACK_COMPONENT_${upper}_DESCRIPTION "${summary}\n${text}" PARENT_SCOPE)
        set(folder ${made}/${package})
        file(READ LICENSE license)
        file(READ NOTICE notice)
        file(CONFIGURE OUTPUT ${folder}/copyright CONTENT "${license}\n\n${notice}" @ONLY)
        file(CONFIGURE OUTPUT ${folder}/changelog.Debian @ONLY CONTENT
"${package} (${PROJECT_VERSION}-${CPACK_DEBIAN_PACKAGE_RELEASE}) unstable; urgency=medium

  * CHANGELOG.md of the sources tells what is new.

 -- ${CPACK_PACKAGE_CONTACT}  ${date}
")
        execute_process(COMMAND gzip -9nf changelog.Debian WORKING_DIRECTORY ${folder}
            COMMAND_ERROR_IS_FATAL ANY)
        install(FILES ${folder}/copyright ${folder}/changelog.Debian.gz
            DESTINATION ${CMAKE_INSTALL_DATAROOTDIR}/doc/${package} COMPONENT ${component})
    endfunction()
    set(CPACK_PACKAGE_CONTACT "KYV DSP developers <kyvdsp@example.org>")
    kyv_debian(module kyvdsp video "" "video effects and their command-line host"
"Twelve video effects in one module: color temperature and white balance,
bubbles, refractive bubbles, fireworks and water ripples, a free-form
picture-in-picture, two transitions, and the filters dreamy, light ray and
pencil sketch. kyvhost renders pictures and videos with them.")
    set(CPACK_DEBIAN_MODULE_PACKAGE_RECOMMENDS ffmpeg)
    kyv_debian(development kyvdsp-dev libdevel "kyvdsp ${version}"
        "headers for hosts of the KYV DSP video effects"
"The interface of the module in C and C++, with examples, a pkg-config file
and a CMake package.")
    kyv_debian(bridges kyvdsp-bridges video "kyvdsp ${version}"
        "KYV DSP video effects for ffmpeg and editors"
"The effects as plug-ins of other programs, such as ffmpeg, melt, Kdenlive and
GStreamer.")
    kyv_debian(python python3-kyvdsp python "kyvdsp ${version}, python3, python3-numpy"
        "KYV DSP video effects on NumPy arrays"
"The effects in Python: frames are NumPy arrays, which are read and written
where they are.")
    set(CPACK_DEBIAN_PYTHON_PACKAGE_ARCHITECTURE all)
    foreach(component MODULE BRIDGES)
        set(CPACK_DEBIAN_${component}_PACKAGE_SHLIBDEPS ON)
    endforeach()
    set(CPACK_DEBIAN_PACKAGE_CONTROL_STRICT_PERMISSION ON)
    set(CPACK_DEBIAN_COMPRESSION_TYPE xz)
endif()

set(CPACK_PACKAGE_NAME kyvdsp)
set(CPACK_PACKAGE_VENDOR "KYV DSP developers")
set(CPACK_PACKAGE_DIRECTORY ${PROJECT_BINARY_DIR}/packages)
set(CPACK_PACKAGING_INSTALL_PREFIX ${CMAKE_INSTALL_PREFIX})
if(WIN32)
    set(CPACK_PACKAGING_INSTALL_PREFIX /)
endif()
set(CPACK_STRIP_FILES ON)
set(CPACK_INSTALL_DEFAULT_DIRECTORY_PERMISSIONS
    OWNER_READ OWNER_WRITE OWNER_EXECUTE GROUP_READ GROUP_EXECUTE WORLD_READ WORLD_EXECUTE)
set(CPACK_COMPONENTS_ALL module development bridges python)
set(CPACK_VERBATIM_VARIABLES ON)
# All files have one time, so that the same sources make the same packages.
set(CPACK_PRE_BUILD_SCRIPTS ${PROJECT_SOURCE_DIR}/cmake/SetTimes.cmake)
include(CPack)
