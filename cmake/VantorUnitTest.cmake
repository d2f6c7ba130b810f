# vantor_unit_test(NAME SOURCES file... DEPENDS library... [WRAP function...])
#
# A GoogleTest program of one subsystem, its tests discovered one by one. WRAP names functions of
# the C library that the tests make fail: calls from our own objects go to __wrap_<function>, which
# the test defines.
include(GoogleTest)
include(VantorWrap)

# Most of a build's time would go into the tests: what they include is compiled once for all of
# them, and they themselves are neither optimised nor searched for undefined behaviour. What they
# test is.
set(unitTestOptions -O0 -g1 -U_FORTIFY_SOURCE -fno-sanitize=undefined)
add_executable(unit_test_headers ${PROJECT_SOURCE_DIR}/tests/unit/support/Headers.cc)
target_link_libraries(unit_test_headers PRIVATE GTest::gmock GTest::gtest_main Boost::filesystem)
target_precompile_headers(unit_test_headers PRIVATE
    <gmock/gmock.h> <gtest/gtest.h> <boost/filesystem.hpp>
    <algorithm> <atomic> <deque> <fstream> <functional> <list> <map> <sstream> <thread>)
target_compile_options(unit_test_headers PRIVATE ${unitTestOptions})

function(vantor_unit_test name)
    cmake_parse_arguments(PARSE_ARGV 1 arg "" "" "SOURCES;DEPENDS;WRAP")
    add_executable(${name} ${arg_SOURCES})
    target_include_directories(${name} PRIVATE ${PROJECT_SOURCE_DIR}/tests/unit)
    target_link_libraries(${name} PRIVATE ${arg_DEPENDS} GTest::gmock GTest::gtest_main)
    vantor_wrap(${name} PRIVATE ${arg_WRAP})
    target_precompile_headers(${name} REUSE_FROM unit_test_headers)
    target_compile_options(${name} PRIVATE ${unitTestOptions})
    set_target_properties(${name} PROPERTIES
        RUNTIME_OUTPUT_DIRECTORY ${PROJECT_BINARY_DIR}/bin/tests
        INSTALL_RPATH "$ORIGIN/../../lib;${VANTOR_HOSTLIBS_DIR}")
    gtest_discover_tests(${name}
        DISCOVERY_TIMEOUT 60
        PROPERTIES TIMEOUT 300)
endfunction()
