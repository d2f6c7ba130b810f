# find_package(vantor-plugin): what a plugin of vantor is built with.
#
# vantor_add_plugin(<name> SOURCES <file>...)
#
#     Builds the native plugin <name> as lib<name>.so, with none of its symbols visible to other
#     plugins but the two that vantor reads, and installs it into VANTOR_PLUGIN_DIRECTORY. <name> is
#     also the name of the CMake target. A function that no library has is an error of the link: at
#     boot it would end the boot. For a plugin that calls what another one exports, add the link
#     option -Wl,-z,undefs.
#
# vantor::plugin              the header vantor/plugin.h, for targets made in another way
# VANTOR_PLUGIN_DIRECTORY     where plugins of every kind belong
# VANTOR_COMMAND_DIRECTORY    where descriptions of the commands of JSON plugins belong
set(VANTOR_PLUGIN_DIRECTORY /usr/libexec/vantor/plugins)
set(VANTOR_COMMAND_DIRECTORY /usr/lib/nuvex/nvcli)

if(NOT TARGET vantor::plugin)
    get_filename_component(vantorPluginPrefix "${CMAKE_CURRENT_LIST_DIR}/../../.." ABSOLUTE)
    add_library(vantor::plugin INTERFACE IMPORTED)
    set_target_properties(vantor::plugin PROPERTIES
        INTERFACE_INCLUDE_DIRECTORIES "${vantorPluginPrefix}/include")
endif()

function(vantor_add_plugin name)
    cmake_parse_arguments(PARSE_ARGV 1 arg "" "" "SOURCES")
    if(NOT arg_SOURCES OR arg_UNPARSED_ARGUMENTS)
        message(FATAL_ERROR "usage: vantor_add_plugin(<name> SOURCES <file>...)")
    endif()
    add_library(${name} MODULE ${arg_SOURCES})
    target_link_libraries(${name} PRIVATE vantor::plugin)
    target_link_options(${name} PRIVATE -Wl,-z,defs)
    set_target_properties(${name} PROPERTIES
        PREFIX lib OUTPUT_NAME ${name} SUFFIX .so
        C_VISIBILITY_PRESET hidden
        CXX_VISIBILITY_PRESET hidden
        VISIBILITY_INLINES_HIDDEN ON)
    install(TARGETS ${name} LIBRARY DESTINATION ${VANTOR_PLUGIN_DIRECTORY})
endfunction()
