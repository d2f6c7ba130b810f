# What `cmake --install` puts where. The program, its plugin directory and its files have fixed
# paths, so the prefix is /usr unless somebody asks for another; to lay all of it out elsewhere, set
# DESTDIR. The components are the packages of VantorPackages.cmake.
if(CMAKE_INSTALL_PREFIX_INITIALIZED_TO_DEFAULT)
    set_property(CACHE CMAKE_INSTALL_PREFIX PROPERTY VALUE /usr)
endif()

# Counts the packagings of one version of the program.
set(VANTOR_PACKAGE_REVISION 1)

set(vantorPackaging ${PROJECT_SOURCE_DIR}/packaging)
set(vantorGenerated ${PROJECT_BINARY_DIR}/packaging)

# The folder in which the system's dynamic linker looks, also when it is another architecture's.
set(vantorLibraryFolder lib)
if(CMAKE_LIBRARY_ARCHITECTURE)
    set(vantorLibraryFolder lib/${CMAKE_LIBRARY_ARCHITECTURE})
endif()

# vantor_gzip(<input> <output>): compresses a file so that the same bytes give the same bytes.
find_program(VANTOR_GZIP gzip REQUIRED)
function(vantor_gzip input output)
    set_property(DIRECTORY APPEND PROPERTY CMAKE_CONFIGURE_DEPENDS ${input})
    get_filename_component(folder ${output} DIRECTORY)
    file(MAKE_DIRECTORY ${folder})
    execute_process(COMMAND ${VANTOR_GZIP} -9nc ${input}
        OUTPUT_FILE ${output} COMMAND_ERROR_IS_FATAL ANY)
endfunction()

# vantor_install_documents(<component>): what every package of a Debian system says about itself.
configure_file(${vantorPackaging}/debian/changelog.in ${vantorGenerated}/changelog @ONLY)
vantor_gzip(${vantorGenerated}/changelog ${vantorGenerated}/changelog.Debian.gz)
vantor_gzip(${PROJECT_SOURCE_DIR}/CHANGELOG.md ${vantorGenerated}/changelog.gz)
function(vantor_install_documents component)
    install(FILES
        ${vantorPackaging}/debian/copyright
        ${vantorGenerated}/changelog.Debian.gz
        ${vantorGenerated}/changelog.gz
        DESTINATION share/doc/${component} COMPONENT ${component})
    set(overrides ${vantorPackaging}/debian/${component}.lintian-overrides)
    if(EXISTS ${overrides})
        install(FILES ${overrides} DESTINATION share/lintian/overrides
            RENAME ${component} COMPONENT ${component})
    endif()
endfunction()

# vantor_install_binaries(<component> <destination> <target>...): what is installed lies in the
# system's own folders and finds its libraries there.
function(vantor_install_binaries component destination)
    install(TARGETS ${ARGN} DESTINATION ${destination} COMPONENT ${component})
    foreach(target IN LISTS ARGN)
        set(installed "\$ENV{DESTDIR}\${CMAKE_INSTALL_PREFIX}/${destination}")
        install(CODE "file(RPATH_REMOVE FILE \"${installed}/$<TARGET_FILE_NAME:${target}>\")"
            COMPONENT ${component})
    endforeach()
endfunction()

# vantor: the program, the one that looks at its boots, and all that the host boots it with.
vantor_install_binaries(vantor sbin vantor)
if(TARGET vantor-analyze)
    vantor_install_binaries(vantor sbin vantor-analyze)
endif()
install(DIRECTORY DESTINATION libexec/vantor/plugins COMPONENT vantor)
install(PROGRAMS ${vantorPackaging}/vantor.init DESTINATION /etc/init.d
    RENAME vantor COMPONENT vantor)
install(FILES ${vantorPackaging}/vantor.default DESTINATION /etc/default
    RENAME vantor COMPONENT vantor)
install(FILES ${vantorPackaging}/completion/vantor ${vantorPackaging}/completion/vantor-analyze
    DESTINATION share/bash-completion/completions COMPONENT vantor)
vantor_install_documents(vantor)

# vantor-hostlibs: what a host that has libraries of its own does without.
if(TARGET nvcli)
    vantor_install_binaries(vantor-hostlibs ${vantorLibraryFolder} nvkctl nvkuser basekit)
    vantor_install_binaries(vantor-hostlibs bin nvcli)
    # Each of the folders in which commands are looked for; a missing one is reported at every boot.
    install(DIRECTORY DESTINATION lib/nuvex/nvcli/int/ext COMPONENT vantor-hostlibs)
    install(DIRECTORY DESTINATION lib/nuvex/nvcli/ext COMPONENT vantor-hostlibs)
    install(FILES ${vantorPackaging}/completion/nvcli
        DESTINATION share/bash-completion/completions COMPONENT vantor-hostlibs)
    vantor_install_documents(vantor-hostlibs)
endif()

# vantor-dev: what a plugin is built with, the same for every architecture.
include(CMakePackageConfigHelpers)
write_basic_package_version_file(${vantorGenerated}/vantor-plugin-config-version.cmake
    COMPATIBILITY SameMajorVersion ARCH_INDEPENDENT)
configure_file(${vantorPackaging}/plugin-author/vantor-plugin.pc.in
    ${vantorGenerated}/vantor-plugin.pc @ONLY)
install(FILES ${PROJECT_SOURCE_DIR}/include/vantor/plugin.h
    DESTINATION include/vantor COMPONENT vantor-dev)
install(FILES ${vantorGenerated}/vantor-plugin.pc
    DESTINATION share/pkgconfig COMPONENT vantor-dev)
install(FILES
    ${vantorPackaging}/plugin-author/vantor-plugin-config.cmake
    ${vantorGenerated}/vantor-plugin-config-version.cmake
    DESTINATION share/cmake/vantor-plugin COMPONENT vantor-dev)
install(DIRECTORY ${PROJECT_SOURCE_DIR}/examples/kit/
    DESTINATION share/doc/vantor-dev/examples COMPONENT vantor-dev)
vantor_install_documents(vantor-dev)

if(EXISTS ${PROJECT_SOURCE_DIR}/docs/man/CMakeLists.txt)
    add_subdirectory(docs/man)
endif()
