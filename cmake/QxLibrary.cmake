# The library, put together from one object library per folder of src/.
#
# The folders are layers. Each is compiled once; the library takes all of them, and a test takes
# the folder it is about with the folders below it: a layer that calls upward does not link.

# Global: a project that takes this one in links them, too, where the library is static.
find_package(LibXml2 REQUIRED GLOBAL)
find_package(ICU REQUIRED COMPONENTS uc GLOBAL)
find_package(Threads REQUIRED GLOBAL)

# qx_read_layers(): QX_LAYERS, the folders from the ground up, and for each QX_BELOW_<folder>, the folders
# that it may use, those that they use included.
function(qx_read_layers)
    set(table "${PROJECT_SOURCE_DIR}/cmake/layers.txt")
    set_property(DIRECTORY "${PROJECT_SOURCE_DIR}" APPEND PROPERTY CMAKE_CONFIGURE_DEPENDS "${table}")
    file(STRINGS "${table}" rows REGEX "^[^#]")
    set(layers)
    foreach(row IN LISTS rows)
        string(REGEX MATCH "^([a-z]+) *:([a-z ]*):" row "${row}")
        set(folder "${CMAKE_MATCH_1}")
        separate_arguments(uses UNIX_COMMAND "${CMAKE_MATCH_2}")
        set(below)
        foreach(used IN LISTS uses)
            list(APPEND below ${used} ${below_${used}})
        endforeach()
        list(REMOVE_DUPLICATES below)
        set(below_${folder} ${below})
        set(QX_BELOW_${folder} ${below} PARENT_SCOPE)
        list(APPEND layers ${folder})
    endforeach()
    set(QX_LAYERS ${layers} PARENT_SCOPE)
endfunction()
qx_read_layers()

# Public headers and what using them asks for.
add_library(qx_headers INTERFACE)
target_include_directories(qx_headers INTERFACE "${PROJECT_SOURCE_DIR}/include")
target_compile_features(qx_headers INTERFACE cxx_std_20)

# What linking the objects asks for, whoever links them.
add_library(qx_dependencies INTERFACE)
set(QX_DEPENDENCIES LibXml2::LibXml2 ICU::uc Threads::Threads ${CMAKE_DL_LIBS})
target_link_libraries(qx_dependencies INTERFACE ${QX_DEPENDENCIES})

file(GLOB_RECURSE qx_unclaimed RELATIVE "${PROJECT_SOURCE_DIR}/src" CONFIGURE_DEPENDS
    "${PROJECT_SOURCE_DIR}/src/*.cpp")
# The standard headers of most files are compiled once for all folders. Where a compiler cache is in use, it
# saves more, and knows nothing that was compiled so. Projects that take this one in compile each file alone:
# tests/checks/install.sh sees from that that no file leaves an include to this list.
set(QX_PRECOMPILE OFF)
if(PROJECT_IS_TOP_LEVEL AND NOT CMAKE_CXX_COMPILER_LAUNCHER)
    set(QX_PRECOMPILE ON)
endif()

set(QX_BUILT_LAYERS)
foreach(layer IN LISTS QX_LAYERS)
    set(sources ${qx_unclaimed})
    list(FILTER sources INCLUDE REGEX "^${layer}/")
    if(NOT sources)
        continue()
    endif()
    list(REMOVE_ITEM qx_unclaimed ${sources})
    list(TRANSFORM sources PREPEND "${PROJECT_SOURCE_DIR}/src/")
    add_library(qx_${layer} OBJECT ${sources})
    set_target_properties(qx_${layer} PROPERTIES POSITION_INDEPENDENT_CODE ON)
    target_include_directories(qx_${layer} PRIVATE "${PROJECT_SOURCE_DIR}/src")
    target_link_libraries(qx_${layer} PUBLIC qx_headers PRIVATE qx_warnings)
    if(QX_PRECOMPILE AND QX_BUILT_LAYERS)
        list(GET QX_BUILT_LAYERS 0 lowest)
        target_precompile_headers(qx_${layer} REUSE_FROM qx_${lowest})
    elseif(QX_PRECOMPILE)
        target_precompile_headers(qx_${layer} PRIVATE <algorithm> <array> <charconv> <functional> <memory>
            <optional> <span> <string> <string_view> <unordered_map> <utility> <vector>)
    endif()
    list(APPEND QX_BUILT_LAYERS ${layer})
endforeach()
if(qx_unclaimed)
    message(FATAL_ERROR "No layer holds ${qx_unclaimed}: see cmake/layers.txt")
endif()

# Third-party headers are visible only where they may be used.
if(TARGET qx_base)
    target_link_libraries(qx_base PRIVATE ICU::uc)
endif()
if(TARGET qx_xml)
    target_link_libraries(qx_xml PRIVATE LibXml2::LibXml2)
endif()

# The translated texts, compiled in: see src/host/EmbeddedFiles.h. English needs none.
file(GLOB texts RELATIVE "${PROJECT_SOURCE_DIR}/share" CONFIGURE_DEPENDS
    "${PROJECT_SOURCE_DIR}/share/*.lproj/Localizable.strings")
list(FILTER texts EXCLUDE REGEX "^en\\.lproj/")
set(entries)
foreach(name IN LISTS texts)
    set_property(DIRECTORY APPEND PROPERTY CMAKE_CONFIGURE_DEPENDS "${PROJECT_SOURCE_DIR}/share/${name}")
    file(READ "${PROJECT_SOURCE_DIR}/share/${name}" text)
    string(APPEND entries "    if (name == \"${name}\")\n        return R\"qx(${text})qx\";\n")
endforeach()
set(embedded "${PROJECT_BINARY_DIR}/generated/EmbeddedFiles.cpp")
file(CONFIGURE OUTPUT "${embedded}" @ONLY CONTENT [==[
#include "host/EmbeddedFiles.h"

std::string_view qx::embeddedFile([[maybe_unused]] std::string_view name) {
@entries@    return {};
}
]==])
target_sources(qx_host PRIVATE "${embedded}")

# qx_link_layers(TARGET LAYER...): links the objects of the given layers that have sources.
function(qx_link_layers target)
    foreach(layer IN LISTS ARGN)
        if(TARGET qx_${layer})
            target_link_libraries(${target} PRIVATE qx_${layer})
        endif()
    endforeach()
    target_include_directories(${target} PRIVATE "${PROJECT_SOURCE_DIR}/src")
    target_link_libraries(${target} PRIVATE qx_headers qx_dependencies)
endfunction()

if(NOT QX_BUILT_LAYERS)
    message(STATUS "src/ holds no sources yet: the library is left out")
    return()
endif()

add_library(QXXMLMarshalling)
add_library(QXXMLMarshalling::QXXMLMarshalling ALIAS QXXMLMarshalling)
foreach(layer IN LISTS QX_BUILT_LAYERS)
    target_sources(QXXMLMarshalling PRIVATE $<TARGET_OBJECTS:qx_${layer}>)
endforeach()
# While the major number is 0, each minor version may break what was compiled with another.
set(QX_SOVERSION ${PROJECT_VERSION_MAJOR})
if(PROJECT_VERSION_MAJOR EQUAL 0)
    set(QX_SOVERSION 0.${PROJECT_VERSION_MINOR})
endif()
set_target_properties(QXXMLMarshalling PROPERTIES
    LINKER_LANGUAGE CXX
    VERSION ${PROJECT_VERSION}
    SOVERSION ${QX_SOVERSION})
target_include_directories(QXXMLMarshalling INTERFACE
    "$<BUILD_INTERFACE:${PROJECT_SOURCE_DIR}/include>")
target_compile_features(QXXMLMarshalling INTERFACE cxx_std_20)
target_link_libraries(QXXMLMarshalling PRIVATE ${QX_DEPENDENCIES})

get_target_property(type QXXMLMarshalling TYPE)
if(type STREQUAL "SHARED_LIBRARY")
    set(QX_SHARED ON)
    # Templates of the standard library stay our own: their visibility is not ours to set.
    set(exports "${PROJECT_SOURCE_DIR}/cmake/exports.map")
    target_link_options(QXXMLMarshalling PRIVATE "-Wl,--version-script,${exports}")
    set_property(TARGET QXXMLMarshalling PROPERTY LINK_DEPENDS "${exports}")
    if(CMAKE_CXX_COMPILER_ID STREQUAL "GNU" OR NOT (QX_SANITIZE OR QX_SANITIZE_THREADS OR QX_FUZZ))
        # Clang leaves its sanitizers' symbols to the program.
        target_link_options(QXXMLMarshalling PRIVATE -Wl,-z,defs)
    endif()
else()
    set(QX_SHARED OFF)
    # Nothing calls what translates and logs, it announces itself: programs ask for it by this name.
    set(QX_STATIC_ANCHOR "-Wl,-u,qxHostServices")
    target_link_options(QXXMLMarshalling INTERFACE "${QX_STATIC_ANCHOR}")
endif()

if(PROJECT_IS_TOP_LEVEL)
    # <libdir>/../share/QXXMLMarshalling, as installed.
    file(MAKE_DIRECTORY "${CMAKE_BINARY_DIR}/share")
    file(CREATE_LINK "${PROJECT_SOURCE_DIR}/share" "${CMAKE_BINARY_DIR}/share/QXXMLMarshalling" SYMBOLIC)
endif()
