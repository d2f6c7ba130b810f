# vantor_library(NAME SOURCES file... [DEPENDS library...])
#
# A subsystem, or a small library that stands on its own within one. DEPENDS is the whole of what
# it may use: beside the static library a shared one is linked from the same objects and the
# declared dependencies alone, with no undefined symbol allowed, so that a call against the grain
# fails the build and not some later program that happens to link everything.
function(vantor_library name)
    cmake_parse_arguments(PARSE_ARGV 1 arg "" "" "SOURCES;DEPENDS")
    add_library(${name} STATIC ${arg_SOURCES})
    target_include_directories(${name} PUBLIC
        ${PROJECT_SOURCE_DIR}/src ${PROJECT_SOURCE_DIR}/include)
    target_link_libraries(${name} PUBLIC ${arg_DEPENDS})

    if(NOT VANTOR_SANITIZERS)
        add_library(${name}_link_check SHARED ${PROJECT_SOURCE_DIR}/cmake/LinkCheck.cc)
        target_link_libraries(${name}_link_check PRIVATE
            $<LINK_LIBRARY:WHOLE_ARCHIVE,${name}> ${arg_DEPENDS})
        target_link_options(${name}_link_check PRIVATE -Wl,-z,defs)
        set_target_properties(${name}_link_check PROPERTIES
            LIBRARY_OUTPUT_DIRECTORY ${PROJECT_BINARY_DIR}/link-check)
    endif()
endfunction()
