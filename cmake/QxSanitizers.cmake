# Instrumentation holds for a whole build tree: one object built without it would blind the rest.

if(QX_SANITIZE)
    add_compile_options(-fsanitize=address,undefined -fno-sanitize-recover=all -fno-omit-frame-pointer)
    add_link_options(-fsanitize=address,undefined)
endif()

if(QX_SANITIZE_THREADS)
    if(QX_SANITIZE)
        message(FATAL_ERROR "QX_SANITIZE and QX_SANITIZE_THREADS exclude each other")
    endif()
    add_compile_options(-fsanitize=thread -fno-omit-frame-pointer)
    add_link_options(-fsanitize=thread)
endif()

if(QX_COVERAGE)
    add_compile_options(--coverage -fprofile-update=atomic)
    add_link_options(--coverage)
endif()

if(QX_FUZZ)
    if(NOT CMAKE_CXX_COMPILER_ID MATCHES "Clang")
        message(FATAL_ERROR "QX_FUZZ needs Clang: use the preset fuzz")
    endif()
    add_compile_options(-fsanitize=fuzzer-no-link)
endif()
