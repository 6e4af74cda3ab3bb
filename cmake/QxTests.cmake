# tests/<folder>/*.cpp    -> one GoogleTest program per folder, test_<folder>
# tests/support/*.cpp     -> helpers, linked into those; main.cpp there replaces gtest_main
# tests/support/lasting/*.cpp -> linked into those that are linked with the folder of that name
# docs/samples/*.cpp      -> the samples of the pages in docs/, in test_docs too
# tests/programs/*.cpp    -> one small program each over the shared library, program_<name>
# tests/checks/*.sh       -> scripts, called with the build folder and the source folder
# examples/<name>/demo    -> run on this build, called with the build folder

include(GoogleTest)
find_package(GTest REQUIRED)

# A script that lacks what it needs on this machine ends with 77.
function(qx_add_script_test name label)
    add_test(NAME ${name} COMMAND ${ARGN})
    set_tests_properties(${name} PROPERTIES LABELS ${label} SKIP_RETURN_CODE 77 TIMEOUT 300)
endfunction()

# GoogleTest's header is most of what a test compiles: it is compiled once, here, for all of them.
# The compile definitions must be the same in each of them for that.
set(support "${CMAKE_BINARY_DIR}/test_support.cpp")
file(GENERATE OUTPUT "${support}" CONTENT "// Lets test_support exist while it has no other source.\n")
set(QX_TEST_DEFINITIONS
    QX_SOURCE_DIR="${PROJECT_SOURCE_DIR}"
    QX_BUILD_DIR="${CMAKE_BINARY_DIR}")

file(GLOB_RECURSE support_sources CONFIGURE_DEPENDS "${PROJECT_SOURCE_DIR}/tests/support/*.cpp")
set(main ${support_sources})
list(FILTER main INCLUDE REGEX "/main\\.cpp$")
list(FILTER support_sources EXCLUDE REGEX "/main\\.cpp$|/lasting/")

add_library(test_support STATIC ${support} ${support_sources})
target_precompile_headers(test_support PRIVATE
    <gtest/gtest.h> <functional> <map> <memory> <string> <string_view> <vector>)
target_compile_definitions(test_support PRIVATE ${QX_TEST_DEFINITIONS})
target_include_directories(test_support PRIVATE
    "${PROJECT_SOURCE_DIR}/tests" "${PROJECT_SOURCE_DIR}/src")
target_link_libraries(test_support PRIVATE qx_headers qx_warnings GTest::gtest)

file(GLOB_RECURSE sources RELATIVE "${PROJECT_SOURCE_DIR}/tests" CONFIGURE_DEPENDS
    "${PROJECT_SOURCE_DIR}/tests/*.cpp")
list(FILTER sources EXCLUDE REGEX "^(support|programs|checks|data)/")
if(NOT QX_WITH_TOOLS)
    list(FILTER sources EXCLUDE REGEX "^tools/")
endif()
if(NOT QX_WITH_EXAMPLES)
    list(FILTER sources EXCLUDE REGEX "^examples/")
endif()
set(test_targets)
foreach(source IN LISTS sources)
    cmake_path(GET source PARENT_PATH folder)
    string(REGEX REPLACE "[/-]" "_" folder_name "${folder}")
    set(name test_${folder_name})
    if(NOT TARGET ${name})
        add_executable(${name} ${main})
        target_precompile_headers(${name} REUSE_FROM test_support)
        target_compile_definitions(${name} PRIVATE ${QX_TEST_DEFINITIONS})
        target_include_directories(${name} PRIVATE "${PROJECT_SOURCE_DIR}/tests")
        target_link_libraries(${name} PRIVATE qx_warnings test_support GTest::gtest)
        if(NOT main)
            target_link_libraries(${name} PRIVATE GTest::gtest_main)
        endif()
        if(folder IN_LIST QX_LAYERS)
            # The check for leaks asks the objects of model.
            set(linked ${folder} ${QX_BELOW_${folder_name}} model ${QX_BELOW_model})
            list(REMOVE_DUPLICATES linked)
        else()
            set(linked ${QX_BUILT_LAYERS})
        endif()
        qx_link_layers(${name} ${linked})
        foreach(layer IN ITEMS host repository)
            if(layer IN_LIST linked)
                target_sources(${name} PRIVATE
                    "${PROJECT_SOURCE_DIR}/tests/support/lasting/${layer}.cpp")
            endif()
        endforeach()
        if(folder MATCHES "^tools" AND TARGET qx_tool)
            target_link_libraries(${name} PRIVATE qx_tool)
            add_dependencies(${name} qxxml)
        elseif(folder STREQUAL "examples")
            target_link_libraries(${name} PRIVATE ${QX_EXAMPLE_PARTS})
        endif()
        list(APPEND test_targets ${name})
        set(label_${name} "${folder}")
    endif()
    target_sources(${name} PRIVATE "${PROJECT_SOURCE_DIR}/tests/${source}")
endforeach()
file(GLOB samples CONFIGURE_DEPENDS "${PROJECT_SOURCE_DIR}/docs/samples/*.cpp")
target_sources(test_docs PRIVATE ${samples})
foreach(name IN LISTS test_targets)
    # Looked up when ctest starts: a program that was not built does not stop the others.
    gtest_discover_tests(${name}
        DISCOVERY_MODE PRE_TEST
        DISCOVERY_TIMEOUT 60
        TEST_PREFIX "${label_${name}}/"
        PROPERTIES LABELS "${label_${name}}" TIMEOUT 300)
endforeach()
add_custom_target(tests DEPENDS ${test_targets})

if(TARGET QXXMLMarshalling)
    file(GLOB sources CONFIGURE_DEPENDS "${PROJECT_SOURCE_DIR}/tests/programs/*.cpp")
    foreach(source IN LISTS sources)
        cmake_path(GET source STEM name)
        add_executable(program_${name} "${source}")
        target_compile_definitions(program_${name} PRIVATE ${QX_TEST_DEFINITIONS})
        target_link_libraries(program_${name} PRIVATE QXXMLMarshalling qx_warnings)
        add_test(NAME program_${name} COMMAND program_${name})
        set_tests_properties(program_${name} PROPERTIES LABELS programs TIMEOUT 300)
        add_dependencies(tests program_${name})
    endforeach()
    # They take the parser's memory away, and count it.
    foreach(name without_memory undo_without_memory bounded_memory)
        target_link_libraries(program_${name} PRIVATE LibXml2::LibXml2)
    endforeach()

    if(QX_WITH_EXAMPLES)
        file(GLOB demos CONFIGURE_DEPENDS "${PROJECT_SOURCE_DIR}/examples/*/demo")
        foreach(demo IN LISTS demos)
            cmake_path(GET demo PARENT_PATH folder)
            cmake_path(GET folder FILENAME name)
            qx_add_script_test(demo_${name} examples "${demo}" "${CMAKE_BINARY_DIR}")
        endforeach()
    endif()
endif()

file(GLOB checks CONFIGURE_DEPENDS "${PROJECT_SOURCE_DIR}/tests/checks/*.sh")
foreach(check IN LISTS checks)
    cmake_path(GET check STEM name)
    qx_add_script_test(check_${name} checks
        bash "${check}" "${CMAKE_BINARY_DIR}" "${PROJECT_SOURCE_DIR}")
endforeach()
# It compiles the library once more.
set_tests_properties(check_install PROPERTIES TIMEOUT 900)
