# The tool, the examples, the benchmarks and the fuzz programs. All but the fuzz programs of one folder
# use the shared library as a host does.

if(NOT TARGET QXXMLMarshalling)
    return()
endif()

# tools/qxxml: everything but main.cpp is an object library, so that tests reach it.
file(GLOB_RECURSE sources CONFIGURE_DEPENDS "${PROJECT_SOURCE_DIR}/tools/qxxml/*.cpp")
if(QX_WITH_TOOLS AND sources)
    find_package(CLI11 REQUIRED)
    find_package(nlohmann_json REQUIRED)
    set(main ${sources})
    list(FILTER main INCLUDE REGEX "/main\\.cpp$")
    list(FILTER sources EXCLUDE REGEX "/main\\.cpp$")
    add_executable(qxxml ${main})
    target_include_directories(qxxml PRIVATE "${PROJECT_SOURCE_DIR}/tools")
    target_link_libraries(qxxml PRIVATE
        QXXMLMarshalling qx_warnings CLI11::CLI11 nlohmann_json::nlohmann_json)
    if(sources)
        add_library(qx_tool OBJECT ${sources})
        target_include_directories(qx_tool PUBLIC "${PROJECT_SOURCE_DIR}/tools")
        target_link_libraries(qx_tool
            PUBLIC qx_headers CLI11::CLI11 nlohmann_json::nlohmann_json PRIVATE qx_warnings)
        target_link_libraries(qxxml PRIVATE qx_tool)
    endif()

    # The tool prints its own manual page and completions.
    if(NOT CMAKE_CROSSCOMPILING)
        set(QX_TOOL_PAGES "${PROJECT_BINARY_DIR}/pages")
        add_custom_command(TARGET qxxml POST_BUILD VERBATIM
            COMMAND "${CMAKE_COMMAND}" "-DTOOL=$<TARGET_FILE:qxxml>" "-DPAGES=${QX_TOOL_PAGES}"
                -P "${PROJECT_SOURCE_DIR}/cmake/QxToolPages.cmake")
    endif()
endif()

# examples/<name>/*.cpp -> example_<name>: everything but main.cpp is an object library, so that tests
# reach it.
file(GLOB_RECURSE sources RELATIVE "${PROJECT_SOURCE_DIR}/examples" CONFIGURE_DEPENDS
    "${PROJECT_SOURCE_DIR}/examples/*.cpp")
if(QX_WITH_EXAMPLES)
    add_custom_target(examples)
    if(TARGET qxxml)
        add_dependencies(examples qxxml) # demos call it too
    endif()
    foreach(source IN LISTS sources)
        string(REGEX REPLACE "/.*" "" folder "${source}")
        string(REPLACE "-" "_" name "example_${folder}")
        if(NOT TARGET ${name})
            add_executable(${name})
            target_compile_definitions(${name} PRIVATE
                QX_EXAMPLE_DIR="${PROJECT_SOURCE_DIR}/examples/${folder}")
            target_link_libraries(${name} PRIVATE QXXMLMarshalling qx_warnings)
            add_dependencies(examples ${name})
        endif()
        if(source MATCHES "/main\\.cpp$")
            target_sources(${name} PRIVATE "${PROJECT_SOURCE_DIR}/examples/${source}")
            continue()
        endif()
        if(NOT TARGET ${name}_parts)
            add_library(${name}_parts OBJECT)
            target_link_libraries(${name}_parts PUBLIC qx_headers PRIVATE qx_warnings)
            target_link_libraries(${name} PRIVATE ${name}_parts)
            list(APPEND QX_EXAMPLE_PARTS ${name}_parts)
        endif()
        target_sources(${name}_parts PRIVATE "${PROJECT_SOURCE_DIR}/examples/${source}")
    endforeach()
endif()

# bench/*.cpp -> bench
file(GLOB_RECURSE sources CONFIGURE_DEPENDS "${PROJECT_SOURCE_DIR}/bench/*.cpp")
if(QX_WITH_BENCH AND sources)
    find_package(benchmark REQUIRED)
    # bench/peers_<peer>.cpp measures another library, where the machine has it.
    find_package(pugixml QUIET)
    find_package(cereal QUIET)
    find_package(Boost QUIET COMPONENTS serialization)
    set(peers pugixml::pugixml cereal::cereal Boost::serialization)
    set(found)
    foreach(peer IN LISTS peers)
        string(REGEX REPLACE "::.*" "" name "${peer}")
        string(TOLOWER "${name}" name)
        if(TARGET ${peer})
            list(APPEND found ${peer})
        else()
            list(FILTER sources EXCLUDE REGEX "/peers_${name}\\.cpp$")
        endif()
    endforeach()
    add_executable(bench ${sources})
    target_include_directories(bench PRIVATE "${PROJECT_SOURCE_DIR}/bench")
    target_link_libraries(bench PRIVATE
        QXXMLMarshalling qx_warnings benchmark::benchmark LibXml2::LibXml2 ${found})
endif()

# fuzz/*.cpp           -> one program each over the shared library
# fuzz/<folder>/*.cpp  -> one program each that sees inside: it is linked with that folder of src/ and
#                         those below it, as the folder's tests are
file(GLOB sources RELATIVE "${PROJECT_SOURCE_DIR}/fuzz" CONFIGURE_DEPENDS
    "${PROJECT_SOURCE_DIR}/fuzz/*.cpp" "${PROJECT_SOURCE_DIR}/fuzz/*/*.cpp")
if(QX_FUZZ AND sources)
    foreach(source IN LISTS sources)
        cmake_path(GET source STEM name)
        cmake_path(GET source PARENT_PATH folder)
        add_executable(fuzz_${name} "${PROJECT_SOURCE_DIR}/fuzz/${source}")
        target_compile_options(fuzz_${name} PRIVATE -fsanitize=fuzzer)
        target_link_options(fuzz_${name} PRIVATE -fsanitize=fuzzer)
        target_link_libraries(fuzz_${name} PRIVATE qx_warnings)
        if(folder)
            qx_link_layers(fuzz_${name} ${folder} ${QX_BELOW_${folder}})
        else()
            target_link_libraries(fuzz_${name} PRIVATE QXXMLMarshalling)
        endif()
    endforeach()
endif()
