# vantor_unit_test(NAME SOURCES file... DEPENDS library... [WRAP function...])
#
# A GoogleTest program of one subsystem, its tests discovered one by one. WRAP names functions of
# the C library that the tests make fail: calls from our own objects go to __wrap_<function>, which
# the test defines and which may call __real_<function> (ld(1), --wrap).
include(GoogleTest)

function(vantor_unit_test name)
    cmake_parse_arguments(PARSE_ARGV 1 arg "" "" "SOURCES;DEPENDS;WRAP")
    add_executable(${name} ${arg_SOURCES})
    target_include_directories(${name} PRIVATE ${PROJECT_SOURCE_DIR}/tests/unit)
    target_link_libraries(${name} PRIVATE ${arg_DEPENDS} GTest::gmock GTest::gtest_main)
    foreach(function IN LISTS arg_WRAP)
        target_link_options(${name} PRIVATE -Wl,--wrap=${function})
    endforeach()
    # Most of a build's time would go into the tests: what they include is compiled once a program,
    # and they themselves are not optimised. What they test is.
    target_precompile_headers(${name} PRIVATE <gmock/gmock.h> <gtest/gtest.h>)
    target_compile_options(${name} PRIVATE -O0 -g1 -U_FORTIFY_SOURCE)
    set_target_properties(${name} PROPERTIES
        RUNTIME_OUTPUT_DIRECTORY ${PROJECT_BINARY_DIR}/bin/tests
        BUILD_RPATH "$ORIGIN/../../lib")
    gtest_discover_tests(${name}
        DISCOVERY_TIMEOUT 60
        PROPERTIES TIMEOUT 300)
endfunction()
