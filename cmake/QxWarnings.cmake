# qx_warnings: linked privately by every target of this project, never installed.

add_library(qx_warnings INTERFACE)

target_compile_options(qx_warnings INTERFACE
    -Wall -Wextra -Wpedantic
    -Wshadow
    -Wconversion -Wno-sign-conversion
    -Wold-style-cast
    -Wnon-virtual-dtor -Woverloaded-virtual
    -Wextra-semi
    -Wformat=2
    -Wundef
    -Wimplicit-fallthrough)

if(CMAKE_CXX_COMPILER_ID STREQUAL "GNU")
    target_compile_options(qx_warnings INTERFACE
        -Wmissing-declarations -Wduplicated-cond -Wlogical-op -Wsuggest-override)
    if(QX_SANITIZE OR QX_SANITIZE_THREADS)
        # The sanitizers' instrumentation hides initialisations from these analyses.
        target_compile_options(qx_warnings INTERFACE
            -Wno-maybe-uninitialized -Wno-array-bounds -Wno-stringop-overflow -Wno-restrict)
    endif()
elseif(CMAKE_CXX_COMPILER_ID MATCHES "Clang")
    target_compile_options(qx_warnings INTERFACE
        -Wmissing-prototypes -Winconsistent-missing-override -Wno-gnu-zero-variadic-macro-arguments)
endif()

if(QX_WARNINGS_AS_ERRORS)
    target_compile_options(qx_warnings INTERFACE -Werror)
endif()
