# Warnings, hardening and sanitizers, said once for every target of the project.

add_compile_options(
    -Wall -Wextra -Wpedantic -Wshadow -Wconversion -Wsign-conversion -Wformat=2 -Wundef
    -Wcast-align -Wnull-dereference
    $<$<COMPILE_LANGUAGE:CXX>:-Wold-style-cast>
    $<$<COMPILE_LANGUAGE:CXX>:-Wnon-virtual-dtor>
    $<$<COMPILE_LANGUAGE:CXX>:-Woverloaded-virtual>
    $<$<COMPILE_LANGUAGE:CXX>:-Wextra-semi>)
if(VANTOR_WERROR)
    add_compile_options(-Werror)
endif()

# On 32 bits too, files may be large, have large inode numbers and be of the time after 2038.
if(CMAKE_SIZEOF_VOID_P EQUAL 4)
    add_compile_definitions(_FILE_OFFSET_BITS=64 _TIME_BITS=64)
endif()

# Nobody replaces one function of a library by another of the same name: without this, gcc reckons
# with that wherever it compiles for shared objects, and neither joins functions nor calls directly.
add_compile_options(-fno-semantic-interposition)

add_compile_options(-fstack-protector-strong)
add_link_options(-Wl,-z,relro -Wl,-z,now)

if(VANTOR_SANITIZERS)
    add_compile_options(
        -fsanitize=${VANTOR_SANITIZERS} -fno-sanitize-recover=all -fno-omit-frame-pointer)
    add_link_options(-fsanitize=${VANTOR_SANITIZERS})
else()
    # Fortified calls bypass the sanitizers' interceptors, so they are for the hardened builds only.
    add_compile_options($<$<NOT:$<CONFIG:Debug>>:-D_FORTIFY_SOURCE=2>)
endif()

include(CheckPIESupported)
check_pie_supported()
