# Builds for 32-bit Linux with this machine's own gcc, against the userland in build/i386-root, which
# is made if it is not there.
set(CMAKE_SYSTEM_NAME Linux)
set(CMAKE_SYSTEM_PROCESSOR i686)

get_filename_component(vantorSource "${CMAKE_CURRENT_LIST_DIR}/.." ABSOLUTE)
set(CMAKE_SYSROOT ${vantorSource}/build/i386-root)
if(NOT EXISTS ${CMAKE_SYSROOT}/etc/vantor-i386-root)
    execute_process(COMMAND ${vantorSource}/scripts/i386-root COMMAND_ERROR_IS_FATAL ANY)
endif()

set(CMAKE_C_COMPILER gcc)
set(CMAKE_CXX_COMPILER g++)
# Arithmetic on doubles in registers of their own width, so that it gives what it gives on 64 bits.
set(CMAKE_C_FLAGS_INIT "-m32 -msse2 -mfpmath=sse")
set(CMAKE_CXX_FLAGS_INIT "${CMAKE_C_FLAGS_INIT}")
set(CMAKE_LIBRARY_ARCHITECTURE i386-linux-gnu)

# Libraries and headers are the userland's, programs this machine's.
set(CMAKE_FIND_ROOT_PATH_MODE_PROGRAM NEVER)
set(CMAKE_FIND_ROOT_PATH_MODE_LIBRARY ONLY)
set(CMAKE_FIND_ROOT_PATH_MODE_INCLUDE ONLY)
set(CMAKE_FIND_ROOT_PATH_MODE_PACKAGE ONLY)
set(ENV{PKG_CONFIG_LIBDIR} ${CMAKE_SYSROOT}/usr/lib/${CMAKE_LIBRARY_ARCHITECTURE}/pkgconfig)
set(ENV{PKG_CONFIG_SYSROOT_DIR} ${CMAKE_SYSROOT})

# The tests run inside the userland, so that is where they are asked for their names.
set(CMAKE_GTEST_DISCOVER_TESTS_DISCOVERY_MODE PRE_TEST)
