set(Python3_FIND_STRATEGY LOCATION) # the interpreter that the user runs, not the newest around
find_package(Python3 3.9 REQUIRED COMPONENTS Interpreter)

set(QUORIX_PYTHON_TEST_ENVIRONMENT
    ${QUORIX_TEST_ENVIRONMENT}
    "PYTHONPATH=${PROJECT_SOURCE_DIR}/device/python:${PROJECT_SOURCE_DIR}/tests/support/python"
    "PYTHONDONTWRITEBYTECODE=1"
    "QUORIX_HOST_PROGRAM=$<TARGET_FILE:quorix-host>"
    "KORVA_CONTROL_PROGRAM=$<TARGET_FILE:korva-control>"
)

# quorix_add_python_test(NAME COMMAND WORD... [FOLDER ..] [TIMEOUT s] [NAMESPACE])
#
# An entry in CTest that runs Python in the folder, the caller's own where none is given, with the
# client and the host within its reach. NAMESPACE is that of quorix_add_test.
function(quorix_add_python_test name)
    cmake_parse_arguments(arg "NAMESPACE" "TIMEOUT;FOLDER" "COMMAND" ${ARGN})

    set(launcher "")
    if(arg_NAMESPACE)
        set(launcher ${PROJECT_SOURCE_DIR}/tests/support/in-network-namespace)
    endif()
    if(NOT arg_TIMEOUT)
        set(arg_TIMEOUT 300)
    endif()
    if(NOT arg_FOLDER)
        set(arg_FOLDER ${CMAKE_CURRENT_SOURCE_DIR})
    endif()
    add_test(NAME ${name} WORKING_DIRECTORY ${arg_FOLDER}
        COMMAND ${launcher} ${Python3_EXECUTABLE} ${arg_COMMAND})
    set_tests_properties(${name} PROPERTIES TIMEOUT ${arg_TIMEOUT} SKIP_RETURN_CODE 77
        ENVIRONMENT "${QUORIX_PYTHON_TEST_ENVIRONMENT}")
endfunction()
