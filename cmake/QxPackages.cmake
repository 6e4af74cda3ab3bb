# cpack: four Debian packages, of the components in QxInstall.cmake; scripts/package makes them.

if(NOT QX_INSTALL OR NOT QX_SHARED)
    return()
endif()

set(CPACK_GENERATOR DEB)
set(CPACK_PACKAGE_NAME qxxmlmarshalling)
set(CPACK_PACKAGE_VENDOR "The QXXMLMarshalling authors")
set(CPACK_PACKAGE_CONTACT "The QXXMLMarshalling authors <authors@qxxml.invalid>")
set(CPACK_RESOURCE_FILE_LICENSE "${PROJECT_SOURCE_DIR}/LICENSE")
set(CPACK_PACKAGING_INSTALL_PREFIX "${CMAKE_INSTALL_PREFIX}")
set(CPACK_STRIP_FILES ON)
set(CPACK_THREADS 0)

set(CPACK_DEB_COMPONENT_INSTALL ON)
set(CPACK_DEBIAN_FILE_NAME DEB-DEFAULT)
set(CPACK_DEBIAN_PACKAGE_RELEASE 1)
set(CPACK_DEBIAN_PACKAGE_PRIORITY optional)
set(CPACK_DEBIAN_PACKAGE_SHLIBDEPS ON)
set(CPACK_DEBIAN_PACKAGE_SHLIBDEPS_PRIVATE_DIRS "${CMAKE_LIBRARY_OUTPUT_DIRECTORY}")
set(CPACK_DEBIAN_ENABLE_COMPONENT_DEPENDS ON)
# Packages of programs that use the library learn from it which version they need.
set(CPACK_DEBIAN_PACKAGE_GENERATE_SHLIBS ON)

set(CPACK_DEBIAN_LIBRARY_PACKAGE_NAME libqxxmlmarshalling${QX_SOVERSION})
set(CPACK_DEBIAN_LIBRARY_PACKAGE_SECTION libs)
set(CPACK_DEBIAN_LIBRARY_DESCRIPTION "XML documents to objects and back
What maps to what is read at run time, from a mapping document.
This package holds the shared library and its translated texts.")
set(CPACK_DEBIAN_LIBRARY_PACKAGE_CONTROL_EXTRA "${PROJECT_SOURCE_DIR}/cmake/debian/triggers")
set(CPACK_DEBIAN_LIBRARY_PACKAGE_CONTROL_STRICT_PERMISSION ON)

set(CPACK_DEBIAN_DEVELOPMENT_PACKAGE_NAME libqxxmlmarshalling-dev)
set(CPACK_DEBIAN_DEVELOPMENT_PACKAGE_SECTION libdevel)
set(CPACK_DEBIAN_DEVELOPMENT_DESCRIPTION "XML documents to objects and back: headers
What a program needs to be compiled with the library: headers, CMake
and pkg-config files.")

set(CPACK_DEBIAN_TOOL_PACKAGE_NAME qxxml)
set(CPACK_DEBIAN_TOOL_PACKAGE_SECTION text)
set(CPACK_DEBIAN_TOOL_DESCRIPTION "tries mapping documents on XML documents
Reads documents under a mapping and shows what becomes of them, and
makes a first mapping for documents that have none.")

set(CPACK_DEBIAN_DOCUMENTATION_PACKAGE_NAME qxxmlmarshalling-doc)
set(CPACK_DEBIAN_DOCUMENTATION_PACKAGE_SECTION doc)
set(CPACK_DEBIAN_DOCUMENTATION_PACKAGE_ARCHITECTURE all)
set(CPACK_DEBIAN_DOCUMENTATION_PACKAGE_SHLIBDEPS OFF)
set(CPACK_DEBIAN_DOCUMENTATION_DESCRIPTION "XML documents to objects and back: guides
How mapping documents are written, how classes take part, and what
comes back as it was.")

set(components library headers development documentation)
if(TARGET qxxml)
    list(APPEND components tool)
endif()
set(CPACK_COMPONENTS_ALL ${components})
set(CPACK_COMPONENT_DEVELOPMENT_DEPENDS library)
set(CPACK_COMPONENT_TOOL_DEPENDS library)
set(CPACK_COMPONENT_HEADERS_GROUP development)
set(CPACK_COMPONENT_DEVELOPMENT_GROUP development)

# Each package tells its licence and its changes where Debian looks for them; other ways of installing
# have them once.
set(package_files "${PROJECT_BINARY_DIR}/debian")
file(READ LICENSE package_licence)
string(REGEX REPLACE "^.*authors\n\n" "" package_licence "${package_licence}")
string(STRIP "${package_licence}" package_licence)
string(REPLACE "\n" "\n " package_licence " ${package_licence}")
string(REPLACE "\n \n" "\n .\n" package_licence "${package_licence}")
string(TIMESTAMP package_date "%a, %d %b %Y %H:%M:%S +0000" UTC)
configure_file(cmake/debian/copyright.in "${package_files}/copyright" @ONLY)
configure_file(cmake/debian/changelog.in "${package_files}/changelog" @ONLY)
foreach(packed "changelog.Debian|${package_files}/changelog" "changelog|${PROJECT_SOURCE_DIR}/CHANGELOG.md")
    string(REPLACE "|" ";" packed "${packed}")
    list(GET packed 0 name)
    list(GET packed 1 file)
    file(ARCHIVE_CREATE OUTPUT "${package_files}/${name}.gz" PATHS "${file}"
        FORMAT raw COMPRESSION GZip COMPRESSION_LEVEL 9)
endforeach()
foreach(component library development tool documentation)
    string(TOUPPER ${component} upper)
    install(FILES "${package_files}/copyright" "${package_files}/changelog.gz"
            "${package_files}/changelog.Debian.gz"
        EXCLUDE_FROM_ALL COMPONENT ${component}
        DESTINATION "${CMAKE_INSTALL_DATADIR}/doc/${CPACK_DEBIAN_${upper}_PACKAGE_NAME}")
endforeach()

include(CPack)
