#include "plugins/SharedObjectCheck.h"

#include <dlfcn.h>
#include <elf.h>
#include <gtest/gtest.h>
#include <link.h>
#include <sys/socket.h>
#include <sys/stat.h>
#include <sys/un.h>
#include <unistd.h>

#include <algorithm>
#include <cstring>
#include <vector>

#include "plugins/TestObjects.h"
#include "support/FreshProcess.h"
#include "support/PrivateRoot.h"
#include "support/TempFolder.h"

namespace vantor {
namespace {

using support::ObjectPath;
using support::ReadFile;
using support::WriteFile;

const std::string truncated = "file is truncated (a loadable segment lies beyond its end)";

class SharedObjectCheckTest : public ::testing::Test {
protected:
    SharedObjectCheckTest() { support::OpenFault().Reset(); }

    // The verdict on a file of this content.
    std::string VerdictOn(const std::string& content) const {
        WriteFile(path, content);
        return ReasonNotToLoad(path);
    }

    support::TempFolder folder;
    const std::string path = folder.File("x.so");
};

TEST_F(SharedObjectCheckTest, AGoodObjectIsTheLinkersToLoad) {
    EXPECT_EQ(ReasonNotToLoad(ObjectPath("first")), "");
}

TEST_F(SharedObjectCheckTest, AMissingFileIsTheLinkersToReject) {
    EXPECT_EQ(ReasonNotToLoad(path), "");
}

TEST_F(SharedObjectCheckTest, ADanglingLinkIsTheLinkersToReject) {
    ASSERT_EQ(symlink("nowhere", path.c_str()), 0);
    EXPECT_EQ(ReasonNotToLoad(path), "");
}

TEST_F(SharedObjectCheckTest, AFolderIsTheLinkersToReject) {
    ASSERT_EQ(mkdir(path.c_str(), 0700), 0);
    EXPECT_EQ(ReasonNotToLoad(path), "");
}

TEST_F(SharedObjectCheckTest, AFileThatIsNoObjectIsTheLinkersToReject) {
    EXPECT_EQ(VerdictOn(""), "");
    EXPECT_EQ(VerdictOn("x"), "");
    EXPECT_EQ(VerdictOn("#!/bin/sh\nexit 0\n"), "");
    EXPECT_EQ(VerdictOn(std::string(5000, '\0')), "");
}

TEST_F(SharedObjectCheckTest, AnUnreadableFileIsTheLinkersToReject) {
    WriteFile(path, ReadFile(ObjectPath("first")).substr(0, 4096));
    support::OpenFault().FailCall(1, EACCES);
    EXPECT_EQ(ReasonNotToLoad(path), "");
    support::OpenFault().Reset();
}

TEST_F(SharedObjectCheckTest, ANamedPipeIsRefusedWithoutWaitingForAWriter) {
    ASSERT_EQ(mkfifo(path.c_str(), 0600), 0);
    EXPECT_EQ(ReasonNotToLoad(path), "not a regular file");
}

TEST_F(SharedObjectCheckTest, ASocketIsRefused) {
    const int listener = socket(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0);
    sockaddr_un address{};
    address.sun_family = AF_UNIX;
    ASSERT_LT(path.size(), sizeof address.sun_path);
    path.copy(address.sun_path, path.size());
    ASSERT_EQ(bind(listener, reinterpret_cast<const sockaddr*>(&address), sizeof address), 0);
    EXPECT_EQ(ReasonNotToLoad(path), "not a regular file");
    close(listener);
}

TEST_F(SharedObjectCheckTest, ADeviceIsRefused) {
    EXPECT_EQ(ReasonNotToLoad("/dev/null"), "not a regular file");
}

TEST_F(SharedObjectCheckTest, ALinkIsJudgedByWhatItPointsTo) {
    ASSERT_EQ(symlink("/dev/zero", path.c_str()), 0);
    EXPECT_EQ(ReasonNotToLoad(path), "not a regular file");
}

TEST_F(SharedObjectCheckTest, ADeviceOrPipeIsNotEvenOpened) {
    ASSERT_EQ(mkfifo(path.c_str(), 0600), 0);
    support::OpenFault().Reset();
    EXPECT_EQ(ReasonNotToLoad(path), "not a regular file");
    EXPECT_EQ(support::OpenFault().Calls(), 0);
}

// The program headers of an object and the place of each in its file.
class ObjectImage {
public:
    explicit ObjectImage(std::string content) : bytes(std::move(content)) {}

    ElfW(Ehdr) Header() const {
        ElfW(Ehdr) header;
        std::memcpy(&header, bytes.data(), sizeof header);
        return header;
    }
    void SetHeader(const ElfW(Ehdr) & header) { bytes.replace(0, sizeof header, Raw(header)); }

    ElfW(Phdr) Segment(std::size_t index) const {
        ElfW(Phdr) segment;
        std::memcpy(&segment, bytes.data() + SegmentOffset(index), sizeof segment);
        return segment;
    }
    void SetSegment(std::size_t index, const ElfW(Phdr) & segment) {
        bytes.replace(SegmentOffset(index), sizeof segment, Raw(segment));
    }

    // The index of the last segment that is loaded.
    std::size_t LastLoaded() const {
        std::size_t last = 0;
        for (std::size_t i = 0; i < Header().e_phnum; ++i) {
            last = Segment(i).p_type == PT_LOAD ? i : last;
        }
        return last;
    }

    // Where the last byte lies that a loaded segment needs, and one further.
    std::size_t LoadedEnd() const {
        const ElfW(Phdr) last = Segment(LastLoaded());
        return static_cast<std::size_t>(last.p_offset + last.p_filesz);
    }

    std::string bytes;

private:
    template <typename Object>
    static std::string Raw(const Object& object) {
        return {reinterpret_cast<const char*>(&object), sizeof object};
    }

    std::size_t SegmentOffset(std::size_t index) const {
        return static_cast<std::size_t>(Header().e_phoff) + index * sizeof(ElfW(Phdr));
    }
};

class CutObjectTest : public SharedObjectCheckTest {
protected:
    ObjectImage image{ReadFile(ObjectPath("first"))};
};

TEST_F(CutObjectTest, AnObjectThatLacksOneByteOfASegmentIsTruncated) {
    EXPECT_EQ(VerdictOn(image.bytes.substr(0, image.LoadedEnd() - 1)), truncated);
}

TEST_F(CutObjectTest, AnObjectThatLacksOnlyWhatIsNotLoadedIsTheLinkersToLoad) {
    EXPECT_EQ(VerdictOn(image.bytes.substr(0, image.LoadedEnd())), "");
    void* const handle = dlopen(path.c_str(), RTLD_LAZY);
    EXPECT_NE(handle, nullptr);
    dlclose(handle);
}

TEST_F(CutObjectTest, AnObjectCutInItsHeadersIsTheLinkersToReject) {
    const ElfW(Ehdr) header = image.Header();
    const std::size_t end = header.e_phoff + header.e_phnum * sizeof(ElfW(Phdr));
    for (const std::size_t size : {sizeof header - 1, sizeof header, end - sizeof(ElfW(Phdr))}) {
        WriteFile(path, image.bytes.substr(0, size));
        // Segments whose headers are whole may already show the cut.
        const std::string verdict = ReasonNotToLoad(path);
        EXPECT_TRUE(verdict.empty() || verdict == truncated) << size << ": " << verdict;
    }
}

// The linker dies when it is given a file whose pages are missing: that this test ends is the
// point.
TEST_F(CutObjectTest, WhereverAnObjectIsCutItIsRefusedOrTheLinkerAnswers) {
    support::InFreshProcess([this] {
        int refused = 0;
        for (std::size_t size = 0; size < image.bytes.size(); size += 331) {
            if (VerdictOn(image.bytes.substr(0, size)) == truncated) {
                ++refused;
                continue;
            }
            if (void* const handle = dlopen(path.c_str(), RTLD_LAZY); handle != nullptr) {
                EXPECT_GE(size, image.LoadedEnd());
                dlclose(handle);
            }
        }
        EXPECT_GT(refused, 0);
    });
}

TEST_F(CutObjectTest, ASegmentWhoseEndOverflowsIsTruncated) {
    ElfW(Phdr) segment = image.Segment(image.LastLoaded());
    segment.p_filesz = ~decltype(segment.p_filesz){0};
    image.SetSegment(image.LastLoaded(), segment);
    EXPECT_EQ(VerdictOn(image.bytes), truncated);
}

TEST_F(CutObjectTest, ASegmentThatIsNotLoadedMayLieAnywhere) {
    for (std::size_t i = 0; i < image.Header().e_phnum; ++i) {
        ElfW(Phdr) segment = image.Segment(i);
        if (segment.p_type == PT_NOTE || segment.p_type == PT_GNU_EH_FRAME) {
            segment.p_offset = 1U << 30U;
            image.SetSegment(i, segment);
        }
    }
    EXPECT_EQ(VerdictOn(image.bytes), "");
}

TEST_F(CutObjectTest, AHeaderTableBeyondTheEndIsTheLinkersToReject) {
    ElfW(Ehdr) header = image.Header();
    header.e_phoff = ~decltype(header.e_phoff){0} - 10;
    image.SetHeader(header);
    EXPECT_EQ(VerdictOn(image.bytes), "");
}

// Cut short too, but refused by its header before anything of it is touched.
TEST_F(CutObjectTest, AnObjectThatThisProcessCannotLoadIsTheLinkersToReject) {
    struct Change {
        const char* what;
        void (*make)(ElfW(Ehdr) & header);
    };
    const Change changes[] = {
        {"machine", [](ElfW(Ehdr) & header) { header.e_machine = EM_S390; }},
        {"relocatable", [](ElfW(Ehdr) & header) { header.e_type = ET_REL; }},
        {"executable", [](ElfW(Ehdr) & header) { header.e_type = ET_EXEC; }},
        {"byte order", [](ElfW(Ehdr) & header) { header.e_ident[EI_DATA] = ELFDATA2MSB; }},
        {"ident version", [](ElfW(Ehdr) & header) { header.e_ident[EI_VERSION] = 9; }},
        {"version", [](ElfW(Ehdr) & header) { header.e_version = 9; }},
        {"OS ABI", [](ElfW(Ehdr) & header) { header.e_ident[EI_OSABI] = ELFOSABI_HPUX; }},
        {"ABI version", [](ElfW(Ehdr) & header) { header.e_ident[EI_ABIVERSION] = 9; }},
        {"padding", [](ElfW(Ehdr) & header) { header.e_ident[EI_NIDENT - 1] = 1; }},
    };
    for (const Change& change : changes) {
        ObjectImage changed = image;
        ElfW(Ehdr) header = changed.Header();
        change.make(header);
        changed.SetHeader(header);
        EXPECT_EQ(VerdictOn(changed.bytes.substr(0, 4096)), "") << change.what;
        EXPECT_EQ(dlopen(path.c_str(), RTLD_LAZY), nullptr) << change.what;
    }
}

TEST_F(CutObjectTest, ASegmentWithoutBytesOfTheFileMayStartBeyondItsEnd) {
    ElfW(Phdr) segment = image.Segment(image.LastLoaded());
    segment.p_filesz = 0;
    segment.p_offset += 1U << 30U;
    image.SetSegment(image.LastLoaded(), segment);
    EXPECT_EQ(VerdictOn(image.bytes), "");
}

TEST_F(CutObjectTest, AnObjectOfAnotherWordSizeIsTheLinkersToReject) {
    image.bytes.resize(4096);
    image.bytes[EI_CLASS] = static_cast<char>(sizeof(void*) == 4 ? ELFCLASS64 : ELFCLASS32);
    EXPECT_EQ(VerdictOn(image.bytes), "");
}

}  // namespace
}  // namespace vantor
