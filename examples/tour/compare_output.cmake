# Script mode: runs PROGRAM (through EMULATOR when set) with ARGS and compares
# what it prints with the file EXPECTED, ignoring carriage returns.
execute_process(COMMAND ${EMULATOR} ${PROGRAM} ${ARGS}
    OUTPUT_VARIABLE output RESULT_VARIABLE result)
if(NOT result EQUAL 0)
    message(FATAL_ERROR "${PROGRAM} exited with ${result}")
endif()
string(REPLACE "\r" "" output "${output}")
file(READ ${EXPECTED} expected)
if(NOT output STREQUAL expected)
    file(WRITE ${CMAKE_CURRENT_BINARY_DIR}/actual_output.txt "${output}")
    message(FATAL_ERROR "the output differs from ${EXPECTED}; it is in "
                        "${CMAKE_CURRENT_BINARY_DIR}/actual_output.txt")
endif()
