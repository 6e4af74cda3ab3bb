# Library, headers, resources, package configuration and tool.

if(NOT TARGET QXXMLMarshalling)
    return()
endif()

include(CMakePackageConfigHelpers)
set(package_dir "${CMAKE_INSTALL_LIBDIR}/cmake/QXXMLMarshalling")

install(TARGETS QXXMLMarshalling EXPORT QXXMLMarshallingTargets
    LIBRARY DESTINATION "${CMAKE_INSTALL_LIBDIR}")
install(DIRECTORY "${PROJECT_SOURCE_DIR}/include/" DESTINATION "${CMAKE_INSTALL_INCLUDEDIR}"
    COMPONENT headers FILES_MATCHING PATTERN "*.h")
if(EXISTS "${PROJECT_SOURCE_DIR}/share")
    install(DIRECTORY "${PROJECT_SOURCE_DIR}/share/"
        DESTINATION "${CMAKE_INSTALL_DATADIR}/QXXMLMarshalling")
endif()
if(TARGET qxxml)
    install(TARGETS qxxml RUNTIME DESTINATION "${CMAKE_INSTALL_BINDIR}")
endif()

install(EXPORT QXXMLMarshallingTargets NAMESPACE QXXMLMarshalling:: DESTINATION "${package_dir}")
configure_package_config_file(
    "${PROJECT_SOURCE_DIR}/cmake/QXXMLMarshallingConfig.cmake.in"
    "${CMAKE_BINARY_DIR}/QXXMLMarshallingConfig.cmake"
    INSTALL_DESTINATION "${package_dir}")
write_basic_package_version_file("${CMAKE_BINARY_DIR}/QXXMLMarshallingConfigVersion.cmake"
    COMPATIBILITY SameMinorVersion)
install(FILES
    "${CMAKE_BINARY_DIR}/QXXMLMarshallingConfig.cmake"
    "${CMAKE_BINARY_DIR}/QXXMLMarshallingConfigVersion.cmake"
    DESTINATION "${package_dir}")
