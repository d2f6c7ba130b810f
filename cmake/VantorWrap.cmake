# vantor_wrap(TARGET <scope> function...)
#
# Sends the calls of these functions of the C library to __wrap_<function>, which may call
# __real_<function> (ld(1), --wrap). The sources always use the functions' own names; where files
# and times have 64 bits on a 32-bit machine the C library's headers turn a call into one of another
# name (feature_test_macros(7), _FILE_OFFSET_BITS and _TIME_BITS), and the wrappers go with it.
set(VANTOR_RENAMED_CALLS)
if(CMAKE_SIZEOF_VOID_P EQUAL 4)
    set(VANTOR_RENAMED_CALLS
        fcntl=__fcntl_time64 fstat=__fstat64_time64 gettimeofday=__gettimeofday64
        ioctl=__ioctl_time64 mkstemp=mkstemp64 open=open64 readdir=readdir64
        stat=__stat64_time64 time=__time64 wait4=__wait4_time64)
endif()

function(vantor_wrap target scope)
    foreach(function IN LISTS ARGN)
        set(symbol ${function})
        foreach(renamed IN LISTS VANTOR_RENAMED_CALLS)
            if(renamed MATCHES "^${function}=(.*)$")
                set(symbol ${CMAKE_MATCH_1})
                target_compile_definitions(${target} PUBLIC
                    __wrap_${function}=__wrap_${symbol} __real_${function}=__real_${symbol})
            endif()
        endforeach()
        target_link_options(${target} ${scope} -Wl,--wrap=${symbol})
    endforeach()
endfunction()
