# The shared library, put together from one object library per folder of src/.
#
# The folders are layers. Each is compiled once; the shared library takes all of them, and a test takes
# the folder it is about with the folders below it: a layer that calls upward does not link.

find_package(LibXml2 REQUIRED)
find_package(ICU REQUIRED COMPONENTS uc i18n)
find_package(Threads REQUIRED)

set(QX_LAYERS
    platform/object platform/xml platform/system
    mapping repository record resolved marshaller)

# The folders that a folder may use, those that they use included.
set(QX_BELOW_platform_object)
# Documents are read and written as files; property lists are read as documents.
set(QX_BELOW_platform_xml platform/object platform/system)
set(QX_BELOW_platform_system platform/object platform/xml)
set(QX_BELOW_mapping platform/object platform/xml platform/system)
set(QX_BELOW_repository platform/object platform/xml platform/system)
set(QX_BELOW_record platform/object platform/xml platform/system)
set(QX_BELOW_resolved platform/object platform/xml platform/system mapping repository)
set(QX_BELOW_marshaller
    platform/object platform/xml platform/system mapping repository record resolved)

# Public headers and what using them asks for.
add_library(qx_headers INTERFACE)
target_include_directories(qx_headers INTERFACE "${PROJECT_SOURCE_DIR}/include")
target_compile_features(qx_headers INTERFACE cxx_std_20)

# What linking the objects asks for, whoever links them.
add_library(qx_dependencies INTERFACE)
target_link_libraries(qx_dependencies INTERFACE
    LibXml2::LibXml2 ICU::uc ICU::i18n Threads::Threads ${CMAKE_DL_LIBS})

file(GLOB_RECURSE qx_unclaimed RELATIVE "${PROJECT_SOURCE_DIR}/src" CONFIGURE_DEPENDS
    "${PROJECT_SOURCE_DIR}/src/*.cpp")
set(QX_BUILT_LAYERS)
foreach(layer IN LISTS QX_LAYERS)
    set(sources ${qx_unclaimed})
    list(FILTER sources INCLUDE REGEX "^${layer}/")
    if(NOT sources)
        continue()
    endif()
    list(REMOVE_ITEM qx_unclaimed ${sources})
    list(TRANSFORM sources PREPEND "${PROJECT_SOURCE_DIR}/src/")
    string(REPLACE "/" "_" name "${layer}")
    add_library(qx_${name} OBJECT ${sources})
    set_target_properties(qx_${name} PROPERTIES POSITION_INDEPENDENT_CODE ON)
    target_include_directories(qx_${name} PRIVATE "${PROJECT_SOURCE_DIR}/src")
    target_link_libraries(qx_${name} PUBLIC qx_headers PRIVATE qx_warnings)
    list(APPEND QX_BUILT_LAYERS ${layer})
endforeach()
if(qx_unclaimed)
    message(FATAL_ERROR "No layer holds ${qx_unclaimed}: see QX_LAYERS in cmake/QxLibrary.cmake")
endif()

# Third-party headers are visible only where they may be used.
if(TARGET qx_platform_object)
    target_link_libraries(qx_platform_object PRIVATE ICU::uc)
endif()
if(TARGET qx_platform_xml)
    target_link_libraries(qx_platform_xml PRIVATE LibXml2::LibXml2)
endif()
if(TARGET qx_platform_system AND QX_BUILD_TREE_SHARE)
    target_compile_definitions(qx_platform_system PRIVATE
        QX_FRAMEWORK_SHARE_DIR="${PROJECT_SOURCE_DIR}/share")
endif()

# qx_link_layers(TARGET LAYER...): links the objects of the given layers that have sources.
function(qx_link_layers target)
    foreach(layer IN LISTS ARGN)
        string(REPLACE "/" "_" name "${layer}")
        if(TARGET qx_${name})
            target_link_libraries(${target} PRIVATE qx_${name})
        endif()
    endforeach()
    target_include_directories(${target} PRIVATE "${PROJECT_SOURCE_DIR}/src")
    target_link_libraries(${target} PRIVATE qx_headers qx_dependencies)
endfunction()

if(NOT QX_BUILT_LAYERS)
    message(STATUS "src/ holds no sources yet: the library is left out")
    return()
endif()

add_library(QXXMLMarshalling SHARED)
add_library(QXXMLMarshalling::QXXMLMarshalling ALIAS QXXMLMarshalling)
foreach(layer IN LISTS QX_BUILT_LAYERS)
    string(REPLACE "/" "_" name "${layer}")
    target_sources(QXXMLMarshalling PRIVATE $<TARGET_OBJECTS:qx_${name}>)
endforeach()
set_target_properties(QXXMLMarshalling PROPERTIES
    LINKER_LANGUAGE CXX
    VERSION ${PROJECT_VERSION}
    SOVERSION ${PROJECT_VERSION_MAJOR})
target_include_directories(QXXMLMarshalling INTERFACE
    "$<BUILD_INTERFACE:${PROJECT_SOURCE_DIR}/include>"
    "$<INSTALL_INTERFACE:${CMAKE_INSTALL_INCLUDEDIR}>")
target_compile_features(QXXMLMarshalling INTERFACE cxx_std_20)
target_link_libraries(QXXMLMarshalling PRIVATE $<BUILD_INTERFACE:qx_dependencies>)
if(CMAKE_CXX_COMPILER_ID STREQUAL "GNU" OR NOT (QX_SANITIZE OR QX_SANITIZE_THREADS OR QX_FUZZ))
    # Clang leaves its sanitizers' symbols to the program.
    target_link_options(QXXMLMarshalling PRIVATE -Wl,-z,defs)
endif()

# <libdir>/../share/QXXMLMarshalling, as installed.
file(MAKE_DIRECTORY "${CMAKE_BINARY_DIR}/share")
file(CREATE_LINK "${PROJECT_SOURCE_DIR}/share" "${CMAKE_BINARY_DIR}/share/QXXMLMarshalling" SYMBOLIC)
