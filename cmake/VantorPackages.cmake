# The Debian packages, made by scripts/packages: one a component of VantorInstall.cmake.
set(CPACK_GENERATOR DEB)
set(CPACK_COMPONENTS_ALL vantor vantor-dev)
if(NOT VANTOR_HOSTLIBS_DIR)
    list(APPEND CPACK_COMPONENTS_ALL vantor-hostlibs)
endif()
set(CPACK_DEB_COMPONENT_INSTALL ON)
set(CPACK_COMPONENTS_GROUPING IGNORE)
set(CPACK_PACKAGING_INSTALL_PREFIX /usr)
set(CPACK_PACKAGE_DIRECTORY ${PROJECT_BINARY_DIR}/packages)
set(CPACK_STRIP_FILES ON)
# Whatever the umask of who builds the packages.
set(CPACK_INSTALL_DEFAULT_DIRECTORY_PERMISSIONS
    OWNER_READ OWNER_WRITE OWNER_EXECUTE GROUP_READ GROUP_EXECUTE WORLD_READ WORLD_EXECUTE)

set(CPACK_PACKAGE_NAME vantor)
set(CPACK_PACKAGE_VERSION ${PROJECT_VERSION})
set(CPACK_PACKAGE_VENDOR "vantor maintainers")
set(CPACK_PACKAGE_CONTACT "vantor maintainers <maintainers@vantor.example>")
set(CPACK_DEBIAN_PACKAGE_RELEASE ${VANTOR_PACKAGE_REVISION})
set(CPACK_DEBIAN_PACKAGE_MAINTAINER ${CPACK_PACKAGE_CONTACT})
set(CPACK_DEBIAN_PACKAGE_PRIORITY optional)
set(CPACK_DEBIAN_FILE_NAME DEB-DEFAULT)
set(CPACK_DEBIAN_PACKAGE_CONTROL_STRICT_PERMISSION ON)
set(CPACK_DEBIAN_COMPRESSION_TYPE xz)
if(CMAKE_LIBRARY_ARCHITECTURE STREQUAL i386-linux-gnu)
    set(CPACK_DEBIAN_PACKAGE_ARCHITECTURE i386)
else()
    execute_process(COMMAND dpkg --print-architecture
        OUTPUT_VARIABLE CPACK_DEBIAN_PACKAGE_ARCHITECTURE
        OUTPUT_STRIP_TRAILING_WHITESPACE COMMAND_ERROR_IS_FATAL ANY)
endif()
set(CPACK_DEBIAN_PACKAGE_SHLIBDEPS_PRIVATE_DIRS ${CMAKE_LIBRARY_OUTPUT_DIRECTORY})

set(vantorControl ${PROJECT_SOURCE_DIR}/packaging/debian)

set(CPACK_DEBIAN_VANTOR_PACKAGE_NAME vantor)
set(CPACK_DEBIAN_VANTOR_PACKAGE_SECTION admin)
set(CPACK_DEBIAN_VANTOR_PACKAGE_SHLIBDEPS ON)
# A host's own libraries serve as well as ours.
set(CPACK_DEBIAN_VANTOR_PACKAGE_DEPENDS "vantor-hostlibs | vantor-host-libraries")
set(CPACK_DEBIAN_VANTOR_PACKAGE_CONTROL_EXTRA
    ${vantorControl}/vantor/conffiles
    ${vantorControl}/vantor/postinst
    ${vantorControl}/vantor/postrm
    ${vantorControl}/vantor/triggers)
set(CPACK_COMPONENT_VANTOR_DESCRIPTION "boot-time service orchestrator of a server host
vantor finds the host's plugins at boot, works out from what each one provides
and requires which must wait for which, and runs them all, one after the other
or eight at a time. A plugin is a shared object, a document of management
commands, or a shell command put in for debugging. One that fails is reported
and never stops the boot; afterwards a log says what ran when.

The tool vantor-analyze checks plugins before a boot, and draws and compares
what boots took their time for.

The host boots with the init script of this package.")

set(CPACK_DEBIAN_VANTOR-HOSTLIBS_PACKAGE_NAME vantor-hostlibs)
set(CPACK_DEBIAN_VANTOR-HOSTLIBS_PACKAGE_SECTION libs)
set(CPACK_DEBIAN_VANTOR-HOSTLIBS_PACKAGE_SHLIBDEPS ON)
set(CPACK_DEBIAN_VANTOR-HOSTLIBS_PACKAGE_PROVIDES vantor-host-libraries)
set(CPACK_DEBIAN_VANTOR-HOSTLIBS_PACKAGE_CONFLICTS vantor-host-libraries)
set(CPACK_DEBIAN_VANTOR-HOSTLIBS_PACKAGE_REPLACES vantor-host-libraries)
set(CPACK_DEBIAN_VANTOR-HOSTLIBS_PACKAGE_CONTROL_EXTRA
    ${vantorControl}/vantor-hostlibs/triggers
    ${vantorControl}/vantor-hostlibs/postrm)
set(CPACK_COMPONENT_VANTOR-HOSTLIBS_DESCRIPTION "host libraries for machines that have none of their own
The libraries through which vantor raises system alerts and runs management
commands, for hosts that bring no such libraries of their own: alerts become
lines of a file, and commands are those that description files tell of.

The tool nvcli runs one of these commands by hand.")

set(CPACK_DEBIAN_VANTOR-DEV_PACKAGE_NAME vantor-dev)
set(CPACK_DEBIAN_VANTOR-DEV_PACKAGE_SECTION libdevel)
set(CPACK_DEBIAN_VANTOR-DEV_PACKAGE_ARCHITECTURE all)
set(CPACK_DEBIAN_VANTOR-DEV_PACKAGE_SUGGESTS "vantor, cmake, pkg-config")
set(CPACK_COMPONENT_VANTOR-DEV_DESCRIPTION "header and build rules for plugins of vantor
What native plugins of the boot-time service orchestrator are built with: the
header, in C and in C++, a pkg-config file and a CMake package.

The examples hold a plugin of each kind, ready to be built and booted.")

include(CPack)
