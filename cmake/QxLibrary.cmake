# The shared library, put together from one object library per folder of src/.
#
# The folders are layers. Each is compiled once; the shared library takes all of them, and a test takes
# the folder it is about with the folders below it: a layer that calls upward does not link.

find_package(LibXml2 REQUIRED)
find_package(ICU REQUIRED COMPONENTS uc i18n)
find_package(Threads REQUIRED)

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
    add_library(qx_${layer} OBJECT ${sources})
    set_target_properties(qx_${layer} PROPERTIES POSITION_INDEPENDENT_CODE ON)
    target_include_directories(qx_${layer} PRIVATE "${PROJECT_SOURCE_DIR}/src")
    target_link_libraries(qx_${layer} PUBLIC qx_headers PRIVATE qx_warnings)
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
if(TARGET qx_host AND QX_BUILD_TREE_SHARE)
    target_compile_definitions(qx_host PRIVATE
        QX_FRAMEWORK_SHARE_DIR="${PROJECT_SOURCE_DIR}/share")
endif()

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

add_library(QXXMLMarshalling SHARED)
add_library(QXXMLMarshalling::QXXMLMarshalling ALIAS QXXMLMarshalling)
foreach(layer IN LISTS QX_BUILT_LAYERS)
    target_sources(QXXMLMarshalling PRIVATE $<TARGET_OBJECTS:qx_${layer}>)
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
