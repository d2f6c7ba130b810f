// What may lie at the path of a document, and what may not.

#include <fcntl.h>
#include <gmock/gmock.h>
#include <sys/mman.h>
#include <sys/resource.h>
#include <sys/socket.h>
#include <sys/stat.h>
#include <sys/un.h>
#include <unistd.h>

#include <boost/filesystem/operations.hpp>

#include "io/Privileges.h"
#include "json/JSONPluginFixture.h"
#include "support/FreshProcess.h"

namespace vantor {

namespace {

using support::DocumentText;
using support::InFreshProcess;
using support::WithoutFilePrivileges;
using support::WriteFile;

class JSONPluginFileTest : public support::JSONPluginFixture {
protected:
    static void ExpectNoSuchFile(const std::string& file) {
        EXPECT_EQ(RejectionOfFile(file), Invalid(file, "no such file or directory"));
    }

    static void Link(const std::string& target, const std::string& link) {
        ASSERT_EQ(symlink(target.c_str(), link.c_str()), 0);
    }

    static std::ptrdiff_t OpenDescriptors() {
        return std::distance(boost::filesystem::directory_iterator("/proc/self/fd"),
                             boost::filesystem::directory_iterator());
    }

    void WriteDocument(const std::string& file) const { WriteFile(file, DocumentText().Text()); }
};

TEST_F(JSONPluginFileTest, AbsentFile) { ExpectNoSuchFile(path); }

TEST_F(JSONPluginFileTest, EmptyPath) { ExpectNoSuchFile(""); }

TEST_F(JSONPluginFileTest, Folder) {
    boost::filesystem::create_directory(path);
    ExpectNoSuchFile(path);
    ExpectNoSuchFile(path + "/");
}

// None of these blocks, though nobody is at the other end.
TEST_F(JSONPluginFileTest, Fifo) {
    ASSERT_EQ(mkfifo(path.c_str(), 0600), 0);
    ExpectNoSuchFile(path);
}

TEST_F(JSONPluginFileTest, Socket) {
    const int listener = socket(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0);
    ASSERT_GE(listener, 0);
    sockaddr_un address{};
    address.sun_family = AF_UNIX;
    ASSERT_LT(path.size(), sizeof address.sun_path);
    path.copy(address.sun_path, path.size());
    ASSERT_EQ(bind(listener, reinterpret_cast<const sockaddr*>(&address), sizeof address), 0);
    ExpectNoSuchFile(path);
    close(listener);
}

TEST_F(JSONPluginFileTest, Device) {
    ExpectNoSuchFile("/dev/null");
    ExpectNoSuchFile("/dev/zero");
}

TEST_F(JSONPluginFileTest, DanglingLink) {
    Link(folder.File("absent.json"), path);
    ExpectNoSuchFile(path);
}

TEST_F(JSONPluginFileTest, LinkToItself) {
    Link(path, path);
    ExpectNoSuchFile(path);
}

TEST_F(JSONPluginFileTest, LinkToAFifo) {
    ASSERT_EQ(mkfifo(folder.File("fifo").c_str(), 0600), 0);
    Link("fifo", path);
    ExpectNoSuchFile(path);
}

TEST_F(JSONPluginFileTest, FileThatMayNotBeRead) {
    WriteDocument(path);
    ASSERT_EQ(chmod(path.c_str(), 0000), 0);
    const WithoutFilePrivileges ordinary;
    ExpectNoSuchFile(path);
}

TEST_F(JSONPluginFileTest, FolderThatMayNotBeSearched) {
    const std::string closed = folder.File("closed");
    boost::filesystem::create_directory(closed);
    WriteDocument(closed + "/netcfg.json");
    ASSERT_EQ(chmod(closed.c_str(), 0600), 0);
    {
        const WithoutFilePrivileges ordinary;
        ExpectNoSuchFile(closed + "/netcfg.json");
    }
    ASSERT_EQ(chmod(closed.c_str(), 0700), 0);
}

TEST_F(JSONPluginFileTest, PathThroughAFile) {
    WriteDocument(path);
    ExpectNoSuchFile(path + "/netcfg.json");
}

TEST_F(JSONPluginFileTest, NameThatIsTooLong) {
    ExpectNoSuchFile(folder.File(std::string(300, 'x') + ".json"));
}

TEST_F(JSONPluginFileTest, NoDescriptorLeft) {
    const std::string unreadable = folder.File("unreadable.json");
    WriteDocument(path);
    WriteDocument(unreadable);
    ASSERT_EQ(chmod(unreadable.c_str(), 0000), 0);
    InFreshProcess([this, &unreadable] {
        {
            // A sanitizer needs descriptors to check an object of a type that it meets for the
            // first time: it meets here all that a refused open brings.
            const WithoutFilePrivileges ordinary;
            ExpectNoSuchFile(unreadable);
        }
        const rlimit none{0, 0};
        ASSERT_EQ(setrlimit(RLIMIT_NOFILE, &none), 0);
        ExpectNoSuchFile(path);
    });
}

// It can be opened, and reading it fails at its first byte.
TEST_F(JSONPluginFileTest, FileWhoseReadingFailsHasNoObject) {
    const std::string memory = "/proc/self/mem";
    EXPECT_EQ(RejectionOfFile(memory), Invalid(memory, "plugin root is not an object"));
}

TEST_F(JSONPluginFileTest, LinkToADocumentIsADocument) {
    WriteDocument(folder.File("other"));
    Link("other", path);
    EXPECT_EQ(Open(path)->Name(), "netcfg");
}

TEST_F(JSONPluginFileTest, NameOfTheFileDoesNotMatter) {
    const std::string odd = folder.File(" no extension\n");
    WriteDocument(odd);
    EXPECT_EQ(Open(odd)->Name(), "netcfg");
}

TEST_F(JSONPluginFileTest, FileMayLieInMemory) {
    const int memory = memfd_create("document", MFD_CLOEXEC);
    ASSERT_GE(memory, 0);
    const std::string text = DocumentText().Text();
    ASSERT_EQ(write(memory, text.data(), text.size()), static_cast<ssize_t>(text.size()));
    EXPECT_EQ(Open("/proc/self/fd/" + std::to_string(memory))->ApiVersion(), 3);
    close(memory);
}

TEST_F(JSONPluginFileTest, FileIsClosedWhateverItHolds) {
    const auto before = OpenDescriptors();
    const auto plugin = Load(DocumentText());
    EXPECT_EQ(OpenDescriptors(), before);
    for (const std::string text : {"", "nonsense", "{}", "{\"metadata\": {\"version\": 1}}"}) {
        EXPECT_NE(RejectionOf(text), "(no exception)");
        EXPECT_EQ(OpenDescriptors(), before) << text;
    }
}

}  // namespace

}  // namespace vantor
