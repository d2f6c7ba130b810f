# Shared objects that the tests load as plugins, all named in `testObjects` and built into the
# folder objects/ of the build.

set(testObjects)

# test_object(NAME SOURCE [DEFINITION...]): lib<NAME>.so.
function(test_object name source)
    add_library(test_object_${name} MODULE objects/${source})
    target_include_directories(test_object_${name} PRIVATE
        ${PROJECT_SOURCE_DIR}/include ${PROJECT_SOURCE_DIR}/tests/unit)
    target_compile_definitions(test_object_${name} PRIVATE ${ARGN})
    # As a host has its plugins: built apart. Nor would the address sanitizer stand two objects that
    # both define "operations" and "metadata".
    target_compile_options(test_object_${name} PRIVATE -fno-sanitize=all)
    set_target_properties(test_object_${name} PROPERTIES
        OUTPUT_NAME ${name}
        LIBRARY_OUTPUT_DIRECTORY ${CMAKE_CURRENT_BINARY_DIR}/objects)
    set(testObjects ${testObjects} test_object_${name} PARENT_SCOPE)
endfunction()

foreach(version RANGE 0 5)
    test_object(version${version} versioned.c OBJECT_VERSION=${version})
endforeach()
foreach(name no_operations no_metadata null_methods null_lists empty_lists failing)
    test_object(${name} ${name}.c)
endforeach()
test_object(throwing throwing.cc)
test_object(first same_method.c)
test_object(second same_method.c)
test_object(run_once run_once.c "OBJECT_VERSION=\"1.0\"")
test_object(run_once_unclean run_once.c "OBJECT_VERSION=\"1:0 b\"")

# The project's own objects are bound when they are opened; a plugin may leave that to its calls.
test_object(unresolved unresolved.c)
target_link_options(test_object_unresolved PRIVATE -Wl,-z,lazy)

# The interface in every language that it promises, with the project's strict warnings, and with
# everything hidden that is not exported by name.
test_object(in_c11 every_language.c)
set_target_properties(test_object_in_c11 PROPERTIES C_STANDARD 11 C_EXTENSIONS OFF)
foreach(standard 11 17 20)
    test_object(in_cxx${standard} every_language.cc)
    set_target_properties(test_object_in_cxx${standard} PROPERTIES CXX_STANDARD ${standard})
endforeach()
foreach(language c11 cxx11 cxx17 cxx20)
    target_compile_options(test_object_in_${language} PRIVATE -fvisibility=hidden)
endforeach()

# What must not compile, and beside it the same source without the one line that is wrong.
foreach(language c c++)
    set(compile ${CMAKE_C_COMPILER} -x ${language} -fsyntax-only -I${PROJECT_SOURCE_DIR}/include
        ${CMAKE_CURRENT_SOURCE_DIR}/objects/exported_method.c)
    add_test(NAME PluginInterface.AnExportedMethodDoesNotCompileIntoATable/${language}
        COMMAND ${compile})
    set_tests_properties(PluginInterface.AnExportedMethodDoesNotCompileIntoATable/${language}
        PROPERTIES PASS_REGULAR_EXPRESSION
        "error: [^\n]*Start[^\n]*static|error: static declaration of [^\n]*Start")
    add_test(NAME PluginInterface.AnExportedFunctionThatIsNoMethodCompiles/${language}
        COMMAND ${compile} -DWITHOUT_TABLE)
endforeach()
