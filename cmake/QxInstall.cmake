# Library, headers, resources, package configuration, tool, licence and guides. A component is what a
# package holds, see QxPackages.cmake.

include(GNUInstallDirs)
include(CMakePackageConfigHelpers)
set(package_dir "${CMAKE_INSTALL_LIBDIR}/cmake/QXXMLMarshalling")

install(TARGETS QXXMLMarshalling EXPORT QXXMLMarshallingTargets
    LIBRARY DESTINATION "${CMAKE_INSTALL_LIBDIR}" COMPONENT library NAMELINK_COMPONENT development
    ARCHIVE DESTINATION "${CMAKE_INSTALL_LIBDIR}" COMPONENT development
    INCLUDES DESTINATION "${CMAKE_INSTALL_INCLUDEDIR}")
install(DIRECTORY "${PROJECT_SOURCE_DIR}/share/"
    DESTINATION "${CMAKE_INSTALL_DATADIR}/QXXMLMarshalling" COMPONENT library)
install(DIRECTORY "${PROJECT_SOURCE_DIR}/include/" DESTINATION "${CMAKE_INSTALL_INCLUDEDIR}"
    COMPONENT headers FILES_MATCHING PATTERN "*.h")

# For find_package and pkg-config. libxml2 and ICU do not show in the headers: programs link them only
# with the static library.
install(EXPORT QXXMLMarshallingTargets NAMESPACE QXXMLMarshalling::
    DESTINATION "${package_dir}" COMPONENT development)
set(config "${PROJECT_BINARY_DIR}/QXXMLMarshallingConfig")
configure_package_config_file("${PROJECT_SOURCE_DIR}/cmake/QXXMLMarshallingConfig.cmake.in"
    "${config}.cmake" INSTALL_DESTINATION "${package_dir}")
write_basic_package_version_file("${config}Version.cmake"
    VERSION ${PROJECT_VERSION} COMPATIBILITY SameMinorVersion)
install(FILES "${config}.cmake" "${config}Version.cmake"
    DESTINATION "${package_dir}" COMPONENT development)

set(pc_dir "${CMAKE_INSTALL_FULL_LIBDIR}/pkgconfig")
file(RELATIVE_PATH QX_PC_PREFIX "${pc_dir}" "${CMAKE_INSTALL_PREFIX}")
file(RELATIVE_PATH QX_PC_LIBDIR "${CMAKE_INSTALL_PREFIX}" "${CMAKE_INSTALL_FULL_LIBDIR}")
file(RELATIVE_PATH QX_PC_INCLUDEDIR "${CMAKE_INSTALL_PREFIX}" "${CMAKE_INSTALL_FULL_INCLUDEDIR}")
set(QX_PC_REQUIRES)
set(QX_PC_LIBS)
if(NOT QX_SHARED)
    set(QX_PC_REQUIRES "libxml-2.0 icu-uc")
    set(QX_PC_LIBS "${QX_STATIC_ANCHOR} -pthread")
endif()
configure_file("${PROJECT_SOURCE_DIR}/cmake/QXXMLMarshalling.pc.in"
    "${PROJECT_BINARY_DIR}/QXXMLMarshalling.pc" @ONLY)
install(FILES "${PROJECT_BINARY_DIR}/QXXMLMarshalling.pc"
    DESTINATION "${CMAKE_INSTALL_LIBDIR}/pkgconfig" COMPONENT development)

if(TARGET qxxml)
    install(TARGETS qxxml RUNTIME DESTINATION "${CMAKE_INSTALL_BINDIR}" COMPONENT tool)
    if(NOT CMAKE_INSTALL_FULL_LIBDIR IN_LIST CMAKE_CXX_IMPLICIT_LINK_DIRECTORIES)
        file(RELATIVE_PATH to_library
            "${CMAKE_INSTALL_FULL_BINDIR}" "${CMAKE_INSTALL_FULL_LIBDIR}")
        set_target_properties(qxxml PROPERTIES INSTALL_RPATH "$ORIGIN/${to_library}")
    endif()
    if(QX_TOOL_PAGES)
        foreach(page
            "qxxml.1.gz|${CMAKE_INSTALL_MANDIR}/man1"
            "qxxml|${CMAKE_INSTALL_DATADIR}/bash-completion/completions"
            "_qxxml|${CMAKE_INSTALL_DATADIR}/zsh/site-functions"
            "qxxml.fish|${CMAKE_INSTALL_DATADIR}/fish/vendor_completions.d")
            string(REPLACE "|" ";" page "${page}")
            list(GET page 0 file)
            list(GET page 1 folder)
            install(FILES "${QX_TOOL_PAGES}/${file}" DESTINATION "${folder}" COMPONENT tool)
        endforeach()
    endif()
endif()

install(FILES LICENSE README.md CHANGELOG.md
    DESTINATION "${CMAKE_INSTALL_DOCDIR}" COMPONENT documentation)
install(DIRECTORY docs/ DESTINATION "${CMAKE_INSTALL_DOCDIR}/docs" COMPONENT documentation
    FILES_MATCHING PATTERN "*.md" PATTERN "*.svg" PATTERN samples EXCLUDE PATTERN site EXCLUDE)
# Pages link to them.
install(DIRECTORY examples DESTINATION "${CMAKE_INSTALL_DOCDIR}" COMPONENT documentation)
