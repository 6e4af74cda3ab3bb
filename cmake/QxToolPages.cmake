# Run after qxxml was built: its manual page and its completions, named as they are installed; the page
# is installed compressed.
# -DTOOL=<the program> -DPAGES=<where they are to lie>

# Leaks are for the tests to find.
set(ENV{ASAN_OPTIONS} "detect_leaks=0")
foreach(page "manual|qxxml.1" "completion bash|qxxml" "completion zsh|_qxxml" "completion fish|qxxml.fish")
    string(REGEX MATCH "^(.*)\\|(.*)$" page "${page}")
    set(file "${PAGES}/${CMAKE_MATCH_2}")
    separate_arguments(command UNIX_COMMAND "${CMAKE_MATCH_1}")
    execute_process(COMMAND "${TOOL}" ${command} OUTPUT_VARIABLE text COMMAND_ERROR_IS_FATAL ANY)
    file(WRITE "${file}" "${text}")
endforeach()
file(ARCHIVE_CREATE OUTPUT "${PAGES}/qxxml.1.gz" PATHS "${PAGES}/qxxml.1"
    FORMAT raw COMPRESSION GZip COMPRESSION_LEVEL 9)
