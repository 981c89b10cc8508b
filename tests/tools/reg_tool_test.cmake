# Script mode: runs the registry tool TOOL (through EMULATOR when set) verb by
# verb, checking exit codes and what it prints; then a tree with values of
# every type goes out to a file, is deleted, comes back from the file into an
# empty registry and goes out again: both files must be the same, and equal to
# EXPECTED (UTF-8 there, with @KEY@ for the tree's path).
#
# On Linux each registry is a fresh VASKEL_REGISTRY folder under WORK_DIR;
# under Wine the tree is a key of its own below HKCU, deleted at the end.

file(REMOVE_RECURSE "${WORK_DIR}")
file(MAKE_DIRECTORY "${WORK_DIR}")
string(RANDOM LENGTH 12 unique)
set(key "HKCU\\Software\\VaskelRegTest-${unique}")
set(full "HKEY_CURRENT_USER\\Software\\VaskelRegTest-${unique}")
if(NOT EMULATOR)
    set(ENV{VASKEL_REGISTRY} "${WORK_DIR}/registry")
endif()
set(failures "")

# A file's name as the tool takes it: Windows programs under Wine see the
# build machine's files on drive Z:.
function(tool_path file result)
    if(EMULATOR)
        string(REPLACE "/" "\\" file "${file}")
        set(file "Z:${file}")
    endif()
    set(${result} "${file}" PARENT_SCOPE)
endfunction()

# tool(<exit code or ANY> <arguments>... [INPUT <text>]): runs the tool and
# leaves what it printed in `output` and `errors`.
function(tool expected)
    cmake_parse_arguments(PARSE_ARGV 1 arg "" "INPUT" "")
    set(input)
    if(DEFINED arg_INPUT)
        file(WRITE "${WORK_DIR}/input.txt" "${arg_INPUT}")
        set(input INPUT_FILE "${WORK_DIR}/input.txt")
    endif()
    execute_process(COMMAND ${EMULATOR} ${TOOL} ${arg_UNPARSED_ARGUMENTS} ${input}
        RESULT_VARIABLE code OUTPUT_VARIABLE out ERROR_VARIABLE err)
    # The tool says why whenever it fails. Wine, on a loaded machine, now and
    # then ends a program with 1 before it ran, saying nothing: run it again.
    if(EMULATOR AND NOT code EQUAL 0 AND out STREQUAL "" AND err STREQUAL "")
        execute_process(COMMAND ${EMULATOR} ${TOOL} ${arg_UNPARSED_ARGUMENTS} ${input}
            RESULT_VARIABLE code OUTPUT_VARIABLE out ERROR_VARIABLE err)
    endif()
    string(REPLACE "\r" "" out "${out}")
    string(REPLACE "\r" "" err "${err}")
    if(NOT expected STREQUAL "ANY" AND NOT code STREQUAL expected)
        string(APPEND failures "${arg_UNPARSED_ARGUMENTS}: exit code ${code}, expected "
                               "${expected}\n${out}${err}\n")
    endif()
    set(failures "${failures}" PARENT_SCOPE)
    set(output "${out}" PARENT_SCOPE)
    set(errors "${err}" PARENT_SCOPE)
endfunction()

function(expect what text expected)
    if(NOT text STREQUAL expected)
        string(APPEND failures "${what}: got\n[${text}]\nexpected\n[${expected}]\n")
        set(failures "${failures}" PARENT_SCOPE)
    endif()
endfunction()

# Files are compared as hex, too long to show: the message names them.
function(expect_same_file what actual expected)
    file(READ "${actual}" actual_bytes HEX)
    if(NOT actual_bytes STREQUAL expected)
        string(APPEND failures "${what}: ${actual} holds other bytes\n")
        set(failures "${failures}" PARENT_SCOPE)
    endif()
endfunction()

function(expect_in what text part)
    string(FIND "${text}" "${part}" at)
    if(at EQUAL -1)
        string(APPEND failures "${what}: [${part}] is not in\n[${text}]\n")
        set(failures "${failures}" PARENT_SCOPE)
    endif()
endfunction()

tool(ANY delete ${key} /f)

# Values of every type through add, in name order so that every registry
# lists them as they were made.
tool(0 add ${key})
tool(0 add ${key} /ve /d "default text")
tool(0 add ${key} /v Binary /t REG_BINARY /d 00ff10)
tool(0 add ${key} /v Dword /t reg_dword /d 0xdeadbeef)
tool(0 add ${key} /v Expand /t REG_EXPAND_SZ /d "%TEMP%\\x")
string(REPEAT "0123456789" 20 long)
tool(0 add ${key} /v Long /t REG_BINARY /d ${long})
tool(0 add ${key} /v Multi /t REG_MULTI_SZ /d "one\\0two\\0three")
tool(0 add ${key} /v MultiComma /t REG_MULTI_SZ /s , /d a,b,)
tool(0 add ${key} /v None /t REG_NONE /d abc)
tool(0 add ${key} /v Qword -T REG_QWORD -D 18446744073709551615)
tool(0 add ${key} /v Text /d "C:\\Program Files\\x")
tool(0 add ${key} /v Victim /d x)
tool(0 add "${key}\\Doomed" /v Gone /d x)
tool(0 add "${key}\\Empty\\")
tool(0 add "${key}\\Sub\\Deep" /v Leaf /d leaf)
expect("add" "${output}" "The operation completed successfully.\n")

# What add refuses changes nothing.
foreach(arguments
        "/v;Bad;/t;REG_DWORD;/d;4294967296" "/v;Bad;/t;REG_DWORD" "/v;Bad;/t;REG_FOO"
        "/v;Bad;/ve" "/v;Bad;/v;Other" "/v;Bad;/t;REG_MULTI_SZ;/s;#;/d;a##b"
        "/v;Bad;/t;REG_SZ;/s;#" "/v;Bad;/t;REG_BINARY;/d;0x01" "/v;Bad;/d" "/v;Bad;/x")
    tool(1 add ${key} ${arguments})
    expect_in("add ${arguments}" "${errors}" "ERROR: ")
endforeach()
tool(1 query ${key} /v Bad)
tool(1 add HKXX\\Software /f)
tool(1 add "${key}\\\\Twice" /f)
tool(1 frobnicate)
tool(1)
tool(0 /?)
expect_in("usage" "${output}" "vaskel-reg export KEY FILE [/y]")
tool(0 DELETE -?)
expect_in("delete usage" "${output}" "/va")

# Forms add cannot make come from a file without a byte-order mark, which
# also deletes a key and a value.
file(WRITE "${WORK_DIR}/seed.reg" "Windows Registry Editor Version 5.00\n\n"
    "; forms the add verb cannot make\n"
    "[${full}\\Imported]\n"
    "@=\"imported default\"\n"
    "\"Embedded\"=hex(1):61,00,00,00,62,00,00,00\n"
    "\"Escaped \\\"name\\\"\"=\"a \\\"quoted\\\" \\\\ backslash\"\n"
    "\"Odd\"=hex(100):01,02,\\\n  03\n"
    "\"ShortDword\"=hex(4):01,02\n"
    "\"Unterminated\"=hex(1):61,00,62,00\n\n"
    "[-${full}\\Doomed]\n\n"
    "[${full}]\n"
    "\"Victim\"=-\n")
tool_path("${WORK_DIR}/seed.reg" seed)
tool(0 import ${seed})
tool(1 query "${key}\\Doomed")
tool(1 query ${key} /v Victim)

# The layout of query.
tool(0 query ${key} /v Dword)
expect("query /v" "${output}" "\n${full}\n    Dword    REG_DWORD    0xdeadbeef\n\n")
tool(0 query ${key} /v Multi)
expect_in("query REG_MULTI_SZ" "${output}" "    Multi    REG_MULTI_SZ    one\\0two\\0three\n")
tool(0 query ${key} /v Qword)
expect_in("query REG_QWORD" "${output}" "    Qword    REG_QWORD    0xffffffffffffffff\n")
tool(0 query ${key} /v None)
expect_in("query REG_NONE" "${output}" "    None    REG_NONE    6100620063000000\n")
tool(0 query "${key}\\Imported" /ve)
expect_in("query /ve" "${output}" "    (Default)    REG_SZ    imported default\n")
tool(0 query "${key}\\Sub")
expect("query of a key without values" "${output}" "\n${full}\\Sub\\Deep\n")
tool(0 query "${key}\\Sub" /s)
expect("query /s" "${output}" "\n${full}\\Sub\\Deep\n    Leaf    REG_SZ    leaf\n\n")
tool(0 query "${key}\\Empty" /ve)
expect_in("query of an unset default" "${output}" "(Default)    REG_SZ    (value not set)")
tool(0 query ${key} /v Leaf /s)
expect_in("query /v /s" "${output}" "End of search: 1 match(es) found.")
tool(1 query ${key} /v Missing)
expect("missing value" "${errors}"
       "ERROR: The system was unable to find the specified registry key or value.\n")
tool(1 query "${key}\\Missing")
tool(1 query ${key} /v Leaf /s /s)

# Out to a file, which matches the expected one.
tool_path("${WORK_DIR}/first.reg" first)
tool_path("${WORK_DIR}/second.reg" second)
tool(0 export ${key} ${first})
tool(1 export ${key} ${first})
expect_in("export onto a file" "${errors}" "/y")
tool(0 export ${key} ${first} /Y)
tool(1 export "${key}\\Missing" ${second})
file(READ "${EXPECTED}" expected)
string(REPLACE "@KEY@" "${full}" expected "${expected}")
string(REPLACE "\n" "\r\n" expected "${expected}")
string(HEX "${expected}" expected)
string(REGEX REPLACE "(..)" "\\100" expected "${expected}") # ASCII to UTF-16LE
expect_same_file("the exported file, against ${EXPECTED}," "${WORK_DIR}/first.reg"
                 "fffe${expected}")

# Deleted, then back from the file into an empty registry.
tool(0 delete ${key} /f)
tool(1 query ${key})
tool(1 delete ${key} /f)
if(NOT EMULATOR)
    set(ENV{VASKEL_REGISTRY} "${WORK_DIR}/registry-2")
endif()
tool(0 import ${first})
tool(0 export ${key} ${second})
file(READ "${WORK_DIR}/first.reg" exported HEX)
expect_same_file("the file after the round trip" "${WORK_DIR}/second.reg" "${exported}")

# Questions: only yes changes anything, and the end of the input is a no.
tool(1 add ${key} /v Text /d changed INPUT "n\n")
tool(0 query ${key} /v Text)
expect_in("a refused overwrite" "${output}" "C:\\Program Files\\x")
tool(0 add ${key} /v Text /d changed INPUT "maybe\nYes\n")
tool(0 query ${key} /v Text)
expect_in("an accepted overwrite" "${output}" "REG_SZ    changed\n")
tool(1 delete ${key} /v Text INPUT "no\n")
tool(0 query ${key} /v Text)
tool(0 delete ${key} /v Text INPUT "y\n")
tool(1 query ${key} /v Text)
tool(1 delete "${key}\\Sub" INPUT "")
tool(0 query "${key}\\Sub\\Deep")
tool(0 delete "${key}\\Imported" /va /f)
tool(0 query "${key}\\Imported")
expect("a key without values" "${output}" "\n")
tool(0 delete ${key} /ve /f)
tool(1 delete ${key} /ve /f)
tool(1 delete HKCU /f)

# A file with a mistake anywhere changes nothing.
file(WRITE "${WORK_DIR}/broken.reg" "Windows Registry Editor Version 5.00\n\n"
    "[${full}\\Fresh]\n\"a\"=\"b\"\n\"c\"=dword:xyz\n")
tool_path("${WORK_DIR}/broken.reg" broken)
tool(1 import ${broken})
expect_in("a broken file" "${errors}" "line 5")
tool(1 query "${key}\\Fresh")
tool_path("${WORK_DIR}/missing.reg" missing)
tool(1 import ${missing})

tool(ANY delete ${key} /f)
if(failures)
    message(FATAL_ERROR "${failures}")
endif()
file(REMOVE_RECURSE "${WORK_DIR}")
