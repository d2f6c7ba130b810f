// What is foretold of the dynamic linker is what the one of this machine says.

#include "image/LinkerRefusal.h"

#include <dlfcn.h>
#include <elf.h>
#include <gtest/gtest.h>
#include <link.h>

#include "analyze/image/ElfBuilder.h"
#include "support/TempFolder.h"

namespace vantor::analyze {

namespace {

using support::ElfBuilder;
using Kind = LinkerRefusal::Kind;

class LinkerRefusalTest : public ::testing::Test {
protected:
    LinkerRefusalTest() {
        ElfBuilder builder(own);
        support::PluginRecords().AddTo(builder);
        object = builder.Finish();
    }

    // Both must say the same, but for the path.
    void ExpectAgreement(const std::string& content, Kind kind) {
        const std::string path = folder.File(std::to_string(++files) + ".so");
        support::WriteFile(path, content);
        dlerror();
        void* const handle = dlopen(path.c_str(), RTLD_LAZY);
        const char* const said = handle == nullptr ? dlerror() : nullptr;
        if (handle != nullptr) {
            dlclose(handle);
        }
        const LinkerRefusal refusal = AskLinker(content, own);
        EXPECT_EQ(refusal.kind, kind) << refusal.reason;
        EXPECT_EQ(said == nullptr ? "" : std::string(said),
                  refusal.kind == Kind::None ? "" : path + ": " + refusal.reason);
    }
    std::string With(std::uint64_t offset, std::uint64_t number, std::size_t size) const {
        std::string changed = object;
        ElfBuilder::Put(changed, offset, number, size);
        return changed;
    }

    const Architecture own =
        *ArchitectureOf(support::ReadFile("/proc/self/exe").substr(0, architectureBytes));
    const bool narrow = own.WordSize() == 4;
    support::TempFolder folder;
    std::string object;
    int files = 0;
};

TEST_F(LinkerRefusalTest, AGoodObject) { ExpectAgreement(object, Kind::None); }

TEST_F(LinkerRefusalTest, FilesThatAreNoObjects) {
    ExpectAgreement("", Kind::Refused);
    ExpectAgreement("short", Kind::Refused);
    ExpectAgreement(std::string(1000, 'x'), Kind::Refused);
    ExpectAgreement(object.substr(0, own.HeaderSize() - 1), Kind::Refused);
    ExpectAgreement(object.substr(0, own.HeaderSize()), Kind::Refused);
}

TEST_F(LinkerRefusalTest, Idents) {
    ExpectAgreement(With(EI_CLASS, 3U - own.wordClass, 1), Kind::Foreign);
    ExpectAgreement(With(EI_CLASS, 9, 1), Kind::Refused);
    ExpectAgreement(With(EI_DATA, ELFDATA2MSB, 1), Kind::Foreign);
    ExpectAgreement(With(EI_DATA, 7, 1), Kind::Refused);
    ExpectAgreement(With(EI_VERSION, 2, 1), Kind::Refused);
    ExpectAgreement(With(EI_OSABI, ELFOSABI_FREEBSD, 1), Kind::Refused);
    ExpectAgreement(With(EI_OSABI, ELFOSABI_GNU, 1), Kind::None);
    ExpectAgreement(With(EI_ABIVERSION, 1, 1), Kind::Refused);
    ExpectAgreement(With(EI_OSABI, 0x303, 2), Kind::None);
    ExpectAgreement(With(EI_OSABI, 0x403, 2), Kind::Refused);
    ExpectAgreement(With(EI_PAD + 2, 1, 1), Kind::Refused);
}

TEST_F(LinkerRefusalTest, Headers) {
    ExpectAgreement(With(offsetof(ElfW(Ehdr), e_type), ET_REL, 2), Kind::Refused);
    ExpectAgreement(With(offsetof(ElfW(Ehdr), e_type), ET_EXEC, 2), Kind::Refused);
    ExpectAgreement(With(offsetof(ElfW(Ehdr), e_machine), EM_S390, 2), Kind::Foreign);
    ExpectAgreement(With(offsetof(ElfW(Ehdr), e_version), 7, 4), Kind::Refused);
    ExpectAgreement(With(offsetof(ElfW(Ehdr), e_phentsize), 55, 2), Kind::Refused);
    ExpectAgreement(With(offsetof(ElfW(Ehdr), e_phnum), 0, 2), Kind::Refused);
    ExpectAgreement(With(offsetof(ElfW(Ehdr), e_phoff), object.size() - 8, own.WordSize()),
                    Kind::Refused);
}

TEST_F(LinkerRefusalTest, Segments) {
    const std::uint64_t first = sizeof(ElfW(Ehdr));
    const std::uint64_t second = first + sizeof(ElfW(Phdr));
    ExpectAgreement(With(first, PT_NOTE, 4), Kind::Refused);
    ExpectAgreement(With(second, PT_NOTE, 4), Kind::Refused);
    ExpectAgreement(With(first + offsetof(ElfW(Phdr), p_vaddr), 0x20001, own.WordSize()),
                    Kind::Refused);
}

// The linker would die of it, so it is not asked.
TEST_F(LinkerRefusalTest, AnObjectThatWasCutShortIsTheBootProgramsToFind) {
    const LinkerRefusal refusal = AskLinker(object.substr(0, object.size() - 1), own);
    EXPECT_EQ(refusal.kind, Kind::Truncated);
    EXPECT_EQ(refusal.reason, "file is truncated (a loadable segment lies beyond its end)");
}

}  // namespace

}  // namespace vantor::analyze
