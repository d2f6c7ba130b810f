# Doubles of the host for the unit tests, each an object library: a test program that names one
# among its DEPENDS has the double and the linker's options that put it in place.
include_guard(GLOBAL)

# vantor_test_double(NAME SOURCES file... [WRAP function...] [DEPENDS library...])
function(vantor_test_double name)
    cmake_parse_arguments(PARSE_ARGV 1 arg "" "" "SOURCES;WRAP;DEPENDS")
    list(TRANSFORM arg_SOURCES PREPEND ${PROJECT_SOURCE_DIR}/tests/unit/support/)
    add_library(${name} OBJECT ${arg_SOURCES})
    target_include_directories(${name} PUBLIC ${PROJECT_SOURCE_DIR}/tests/unit)
    target_link_libraries(${name} PUBLIC ${arg_DEPENDS})
    vantor_wrap(${name} INTERFACE ${arg_WRAP})
endfunction()

vantor_test_double(test_syslog
    SOURCES SyslogCapture.cc
    WRAP syslog __syslog_chk)

vantor_test_double(test_private_root
    SOURCES PrivateRoot.cc TempFolder.cc
    WRAP access chmod execve mkstemp open rename stat unlink
        _ZN5boost10filesystem6detail6statusERKNS0_4pathEPNS_6system10error_codeE
    DEPENDS Boost::filesystem ${CMAKE_DL_LIBS})

vantor_test_double(test_host_calls
    SOURCES HostCalls.cc
    WRAP chdir fork gettimeofday kill setsid sysinfo system)

# A program's own definitions win over those of the shared library that it is linked with, too.
vantor_test_double(test_system_alerts
    SOURCES AlertRecorder.cc
    DEPENDS vantor_global_lock)
