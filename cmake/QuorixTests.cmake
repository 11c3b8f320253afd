# quorix_add_test(NAME SOURCES... [LIBRARIES ...] [ARGUMENTS ...] [LAUNCHER ...] [TIMEOUT s]
#                 [NAMESPACE] [WINDOWS])
#
# One GoogleTest binary and its entry in CTest. With NAMESPACE the test runs in a network namespace
# of its own, where port 803 is free and may be bound; it is skipped (code 77) only where the kernel
# forbids namespaces. With WINDOWS its main makes a QApplication, whose windows Qt keeps in memory and
# draws without a graphics card. LAUNCHER is a command that runs the test as its arguments.
function(quorix_add_test name)
    cmake_parse_arguments(arg "NAMESPACE;WINDOWS" "TIMEOUT" "SOURCES;LIBRARIES;ARGUMENTS;LABELS;LAUNCHER" ${ARGN})

    add_executable(${name} ${arg_SOURCES})
    target_link_libraries(${name} PRIVATE ${arg_LIBRARIES} Quorix::options GTest::gmock_main)
    target_include_directories(${name} PRIVATE ${PROJECT_SOURCE_DIR}/tests)

    set(launcher ${arg_LAUNCHER})
    if(arg_NAMESPACE)
        list(PREPEND launcher ${PROJECT_SOURCE_DIR}/tests/support/in-network-namespace)
    endif()
    add_test(NAME ${name} COMMAND ${launcher} $<TARGET_FILE:${name}> ${arg_ARGUMENTS})
    if(NOT arg_TIMEOUT)
        set(arg_TIMEOUT 120)
    endif()
    set_tests_properties(${name} PROPERTIES TIMEOUT ${arg_TIMEOUT} SKIP_RETURN_CODE 77
        ENVIRONMENT "${QUORIX_TEST_ENVIRONMENT}")
    if(arg_WINDOWS)
        target_sources(${name} PRIVATE ${PROJECT_SOURCE_DIR}/tests/support/WindowTestMain.cpp)
        target_link_libraries(${name} PRIVATE Qt5::Widgets GTest::gmock)
        set_property(TEST ${name} APPEND PROPERTY ENVIRONMENT ${QUORIX_WINDOW_TEST_ENVIRONMENT})
    endif()
    if(arg_LABELS)
        set_tests_properties(${name} PROPERTIES LABELS "${arg_LABELS}")
    endif()
endfunction()

# A race report, an overflow or a leak fails the test that met it. The second thread sanitizer option
# lets a process that only dies with a report be told from one that fails by itself. What a test
# advertises must not reach the machine's own network: no test finds its D-Bus daemon, unless its
# launcher gives it another. The client library of DNS-SD keeps its advice to itself.
set(QUORIX_TEST_ENVIRONMENT
    "ASAN_OPTIONS=detect_leaks=1:detect_stack_use_after_return=1"
    "UBSAN_OPTIONS=print_stacktrace=1"
    "TSAN_OPTIONS=suppressions=${PROJECT_SOURCE_DIR}/tests/support/tsan.supp:exitcode=66"
    "LSAN_OPTIONS=suppressions=${PROJECT_SOURCE_DIR}/tests/support/lsan.supp:print_suppressions=0"
    "DBUS_SYSTEM_BUS_ADDRESS=unix:path=/nonexistent/bus"
    "AVAHI_COMPAT_NOWARN=1"
    # Programs that a test starts keep their files here and not in the user's home.
    "XDG_DATA_HOME=${PROJECT_BINARY_DIR}/test-data"
    "XDG_CACHE_HOME=${PROJECT_BINARY_DIR}/test-cache"
)

# Without the software backend a Quick view needs OpenGL, which the offscreen platform does not have.
set(QUORIX_WINDOW_TEST_ENVIRONMENT
    "QT_QPA_PLATFORM=offscreen"
    "QT_QUICK_BACKEND=software"
)
