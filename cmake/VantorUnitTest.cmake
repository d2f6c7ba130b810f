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
    # Most of a build's time would go into the tests: what they include is compiled once, by the
    # first program, and they themselves are neither optimised nor searched for undefined behaviour.
    # What they test is.
    get_property(headersOwner GLOBAL PROPERTY VANTOR_TEST_HEADERS_OWNER)
    if(headersOwner)
        target_precompile_headers(${name} REUSE_FROM ${headersOwner})
    else()
        target_precompile_headers(${name} PRIVATE
            <gmock/gmock.h> <gtest/gtest.h> <boost/filesystem.hpp>
            <algorithm> <atomic> <deque> <fstream> <functional> <list> <map> <sstream> <thread>)
        set_property(GLOBAL PROPERTY VANTOR_TEST_HEADERS_OWNER ${name})
    endif()
    target_compile_options(${name} PRIVATE -O0 -g1 -U_FORTIFY_SOURCE
        -fno-sanitize=undefined)
    set_target_properties(${name} PROPERTIES
        RUNTIME_OUTPUT_DIRECTORY ${PROJECT_BINARY_DIR}/bin/tests
        BUILD_RPATH "$ORIGIN/../../lib")
    gtest_discover_tests(${name}
        DISCOVERY_TIMEOUT 60
        PROPERTIES TIMEOUT 300)
endfunction()
