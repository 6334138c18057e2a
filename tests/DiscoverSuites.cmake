# Writes FILE, which adds each test suite of the GoogleTest program PROGRAM as one test, named PREFIX and the suite.
cmake_minimum_required(VERSION 3.25)
execute_process(COMMAND "${PROGRAM}" --gtest_list_tests OUTPUT_VARIABLE listed COMMAND_ERROR_IS_FATAL ANY)
string(REGEX MATCHALL "(^|\n)[^ \n]+\\." suites "${listed}") # its tests follow, indented
set(commands)
foreach(suite ${suites})
  string(REGEX REPLACE "^\n|\\.$" "" suite "${suite}")
  string(APPEND commands "add_test([[${PREFIX}${suite}]] [[${PROGRAM}]] [[--gtest_filter=${suite}.*]])
set_tests_properties([[${PREFIX}${suite}]] PROPERTIES TIMEOUT 300 ENVIRONMENT G_SLICE=always-malloc)\n")
endforeach()
file(WRITE "${FILE}" "${commands}")
