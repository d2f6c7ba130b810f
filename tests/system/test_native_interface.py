"""The binary interface of native plugins, and the header with which they are written."""

import pytest

from harness.base_root import BuildError
from harness.messages import starting
from harness.native_plugin import PluginFactory
from harness.syslog_recorder import ERR, INFO

NOTING = """#include "vantor/plugin.h"
#include <fcntl.h>
#include <unistd.h>
static void Note(const char* line, size_t length) {
    const int fd = open("/tmp/ran", O_WRONLY | O_CREAT | O_APPEND, 0644);
    if (fd < 0 || write(fd, line, length) < 0) { _exit(9); }
    close(fd);
}
"""
TWIN = NOTING + """
VANTOR_METHOD(start) { Note("TEXT\\n", sizeof "TEXT\\n" - 1); return RESULT; }
VANTOR_METHOD(apply) { Note("apply TEXT\\n", sizeof "apply TEXT\\n" - 1); return RESULT; }
VANTOR_OPERATIONS_WITH_HOST_PROFILE(start, apply);
VANTOR_METADATA_2(NULL, NULL);
"""
LISTS = """#include "vantor/plugin.h"
static const char* const needs[] = {"given", NULL};
static const char* const gives[] = {"done", "finished", NULL};
static const char* const flags[] = {"wanted", "needed", NULL};
static const char* const against[] = {"unwanted", NULL};
VANTOR_METHOD(start) { return 3; }
VANTOR_METHOD(apply) { return 4; }
"""
SHORT = LISTS + """
VANTOR_OPERATIONS_WITH_HOST_PROFILE(start, apply);
VANTOR_METADATA_VERSION(needs, gives);
"""
LONG = LISTS + """
VANTOR_OPERATIONS(start);
VANTOR_METADATA_VERSION(needs, gives, "1.0", 1, flags, against);
"""
# A record that ends where the memory ends: one field read too many is the end of the program.
# The exported name is resolved at run time, as an indirect function is, to the mapped record.
AT_THE_EDGE = """#define _GNU_SOURCE
#include "vantor/plugin.h"
#include <sys/mman.h>
#include <unistd.h>
static const char* const gives[] = {"done", NULL};
VANTOR_METHOD(start) { return 0; }
VANTOR_OPERATIONS(start);
typedef void (*Symbol)(void);
static Symbol Record(void) {
    const size_t page = (size_t)sysconf(_SC_PAGESIZE);
    char* memory = mmap(NULL, 2 * page, PROT_READ | PROT_WRITE, MAP_PRIVATE | MAP_ANONYMOUS, -1, 0);
    if (memory == MAP_FAILED || mprotect(memory + page, page, PROT_NONE) != 0) { return NULL; }
    struct vantor_metadata_1* record = (struct vantor_metadata_1*)(memory + page) - 1;
    record->version = VERSION;
    record->provides = gives;
    return (Symbol)record;
}
void metadata(void) __attribute__((ifunc("Record")));
"""


def twin(text, result):
    return TWIN.replace("TEXT", text).replace("RESULT", str(result))


@pytest.mark.parametrize("language", ["c", "cc"])
def test_two_plugins_that_both_declare_start_keep_their_own(root, vantor, language):
    root.compiled("one", twin("the one", 1), language)
    root.compiled("two", twin("the other", 2), language)
    result = vantor("--plugin=libone.so,libtwo.so")
    assert root.ran() == ["the one", "the other"]
    assert result.messages == [
        (INFO, "executing start plugin: one"),
        (ERR, "execution failure in context 'one', returncode 1"),
        (INFO, "executing start plugin: two"),
        (ERR, "execution failure in context 'two', returncode 2"),
    ]


def test_two_plugins_that_both_declare_apply_keep_their_own(root, vantor):
    root.write("/etc/nuvex/hostprofile.xml")
    root.compiled("one", twin("the one", 0), "c")
    root.compiled("two", twin("the other", 0), "cc")
    vantor("--plugin=libtwo.so,libone.so")
    assert root.ran() == ["apply the other", "apply the one"]


def test_the_header_refuses_a_method_that_others_could_see():
    text = """#include "vantor/plugin.h"
uint32_t start(void);
uint32_t start(void) { return 0; }
VANTOR_OPERATIONS(start);
VANTOR_METADATA_1(NULL, NULL);
"""
    for language in ("c", "cc"):
        with pytest.raises(BuildError, match="start"):
            PluginFactory.compile(text, language)


@pytest.mark.parametrize("language, standard", [
    ("c", "-std=c11"), ("c", "-std=gnu17"), ("cc", "-std=c++11"), ("cc", "-std=c++17"),
    ("cc", "-std=c++20"),
])
@pytest.mark.parametrize("version", [1, 2, 3, 4])
def test_every_version_as_the_header_declares_it(root, vantor, language, standard, version):
    text = (SHORT if version < 3 else LONG).replace("VERSION", str(version))
    root.compiled("x", text, language, standard, "-Wno-unused-variable", "-Wno-unused-function",
                  "-Wno-unused-const-variable")
    root.native("giver", provides=["given"])
    root.native("taker", requires=["done", "finished"])
    result = vantor("--plugin-flags=wanted,needed")
    assert result.messages == [
        *starting("giver", "x"), (ERR, "execution failure in context 'x', returncode 3"),
        *starting("taker")]
    assert root.run_once_record() == f"vantor.run-once={'x1.0,' if version >= 3 else ''}\n"
    assert root.alerts() == []


@pytest.mark.parametrize("version", [1, 2])
def test_nothing_is_read_behind_a_short_record(root, vantor, version):
    root.compiled("x", AT_THE_EDGE.replace("VERSION", str(version)), "c")
    root.native("taker", requires=["done"])
    result = vantor()
    assert (result.status, result.messages) == (0, starting("x", "taker"))


def test_null_lists_are_empty(root, vantor):
    root.native("x", null_lists=1)
    result = vantor("--dump-dependency-tree=/tmp/graph.dot", "--plugin-flags=a")
    assert (result.status, result.messages) == (0, [])
    assert "->" not in root.read("/tmp/graph.dot")
    assert 'label="x"' in root.read("/tmp/graph.dot")


def test_a_plugin_may_use_what_one_before_it_exports(root, vantor):
    root.compiled("first", NOTING + """
        void Shared(void);
        void Shared(void) { Note("shared\\n", 7); }
        VANTOR_METHOD(start) { return 0; }
        VANTOR_OPERATIONS(start);
        VANTOR_METADATA_1(NULL, NULL);""")
    root.compiled("second", """#include "vantor/plugin.h"
        void Shared(void);
        VANTOR_METHOD(start) { Shared(); return 0; }
        VANTOR_OPERATIONS(start);
        VANTOR_METADATA_1(NULL, NULL);""")
    vantor("--plugin=libfirst.so,libsecond.so")
    assert root.ran() == ["shared"]


# What the compiler's start-up code in every shared object asks for: declared by hand, as it does.
START_UP = NOTING + """
#include <stddef.h>
__attribute__((weak)) void __gmon_start__(void);
__attribute__((weak)) void _ITM_registerTMCloneTable(void*, size_t);
__attribute__((weak)) void _ITM_deregisterTMCloneTable(void*);
VANTOR_OPERATIONS(start);
VANTOR_METADATA_1(NULL, NULL);
"""
# What that code does for an object with transactions in it.
TRANSACTIONS = START_UP + """
static char table[] = "table";
__attribute__((constructor)) static void Load(void) { _ITM_registerTMCloneTable(table, 3); }
__attribute__((destructor)) static void Unload(void) { _ITM_deregisterTMCloneTable(table); }
VANTOR_METHOD(start) { Note("started\\n", 8); return 0; }
"""

TRANSACTION_LIBRARY = NOTING + """
#include <stddef.h>
void _ITM_registerTMCloneTable(void*, size_t);
void _ITM_registerTMCloneTable(void* table, size_t count) {
    Note(count == 3 && *(char*)table == 't' ? "registered\\n" : "something\\n", 11);
}
void _ITM_deregisterTMCloneTable(void*);
void _ITM_deregisterTMCloneTable(void* table) {
    Note(*(char*)table == 't' ? "deregistered\\n" : "somewhat else", 13);
}
"""


def test_what_every_object_asks_the_linker_for_is_found_in_the_program(root, vantor):
    root.compiled("x", START_UP + """
        VANTOR_METHOD(start) {
            if (__gmon_start__ && _ITM_registerTMCloneTable && _ITM_deregisterTMCloneTable) {
                __gmon_start__();
                Note("found\\n", 6);
            }
            return 0;
        }""")
    result = vantor()
    assert (result.status, root.ran()) == (0, ["found"])


def test_transactions_are_registered_with_the_library_that_a_plugin_before_brings(root, vantor):
    root.compiled("library", TRANSACTION_LIBRARY + """
        VANTOR_METHOD(start) { return 0; }
        VANTOR_OPERATIONS(start);
        VANTOR_METADATA_1(NULL, NULL);""")
    root.compiled("user", TRANSACTIONS)
    result = vantor("--plugin=liblibrary.so,libuser.so")
    assert result.status == 0
    assert root.ran() == ["registered", "started", "deregistered"]


def test_transactions_are_registered_with_the_library_that_is_loaded_with_them(
        root, vantor, tmp_path):
    library = tmp_path / "libtransactions.so"
    library.write_bytes(PluginFactory.compile(TRANSACTION_LIBRARY, "c",
                                              "-Wl,-soname,libtransactions.so"))
    root.write("/usr/libexec/vantor/libtransactions.so", library.read_bytes())
    root.compiled("user", TRANSACTIONS, "c", "-Wl,--no-as-needed", str(library),
                  "-Wl,-rpath,/usr/libexec/vantor")
    result = vantor()
    assert (result.status, result.messages) == (0, starting("user"))
    assert root.ran() == ["registered", "started", "deregistered"]


def test_transactions_of_a_plugin_without_their_library_are_nobodys(root, vantor):
    root.compiled("user", TRANSACTIONS)
    result = vantor()
    assert (result.status, result.messages) == (0, starting("user"))
    assert root.ran() == ["started"]


def test_a_symbol_that_is_missing_is_met_only_when_it_is_called(root, vantor):
    root.compiled("lazy", """#include "vantor/plugin.h"
        void NowhereToBeFound(void);
        VANTOR_METHOD(start) { return 0; }
        VANTOR_METHOD(apply) { NowhereToBeFound(); return 0; }
        VANTOR_OPERATIONS_WITH_HOST_PROFILE(start, apply);
        VANTOR_METADATA_2(NULL, NULL);""", "c", "-Wl,-z,lazy")
    result = vantor()
    assert (result.status, result.messages) == (0, starting("lazy"))
