// Makes plugins of whatever documents libFuzzer makes up, checks that each is rejected for the
// right reason or else has what its document says, and that no barrier keeps a plugin that is gone.

#include <sys/mman.h>
#include <unistd.h>

#include <cstddef>
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <string>

#include "fuzz/PlainDocument.h"
#include "fuzz/PlainReader.h"
#include "fuzz/ReadingComparison.h"
#include "graph/InitBarrier.h"
#include "json/JSONPlugin.h"
#include "plugins/Exceptions.h"

namespace {

using vantor::JSONPlugin;
using vantor::JsonValue;
using vantor::support::PlainReader;

void Require(bool condition, const std::string& what) {
    if (!condition) {
        std::fprintf(stderr, "%s\n", what.c_str());
        std::abort();
    }
}

// The one file in memory that every document is written to.
class DocumentFile {
public:
    DocumentFile() : descriptor(memfd_create("document", MFD_CLOEXEC)) {
        Require(descriptor >= 0, "no file in memory");
    }

    std::string Path() const { return "/proc/self/fd/" + std::to_string(descriptor); }

    void Write(const std::string& text) const {
        Require(ftruncate(descriptor, 0) == 0, "the file cannot be cut off");
        const ssize_t written = pwrite(descriptor, text.data(), text.size(), 0);
        Require(written == static_cast<ssize_t>(text.size()), "the file cannot be written");
    }

private:
    int descriptor;
};

// The message of the rejection; empty for a plugin that is as the document says.
std::string MakePlugin(const std::string& path, const JsonValue& root) {
    try {
        const JSONPlugin plugin("fuzzed", path);
        const std::string difference = vantor::support::CompareWithDocument(plugin, root);
        Require(difference.empty(), "not as the document says: " + difference);
    } catch (const vantor::InvalidPluginException& exception) {
        return exception.what();
    }
    return "";
}

void RequireBare(const std::string& barrierName) {
    const vantor::InitBarrier* const barrier = vantor::InitBarrier::Get(barrierName);
    Require(barrier->Dependencies().empty() && barrier->Dependents().empty(),
            "a barrier keeps a plugin that is gone");
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    static const DocumentFile file;
    const std::string text(data, data + size);
    if (!vantor::support::IsReadToAnEnd(text)) {
        return 0;
    }
    file.Write(text);

    JsonValue root;
    PlainReader(text).ReadValue(root);
    const std::string reason = vantor::support::RejectionReason(root);
    const std::string expected =
        reason.empty() ? "" : "plugin `" + file.Path() + "' is invalid: " + reason;
    const std::string message = MakePlugin(file.Path(), root);
    Require(message == expected, "\"" + message + "\" in place of \"" + expected + "\"");
    for (const std::string& name : vantor::support::BarriersOf(root)) {
        RequireBare(name);
    }
    return 0;
}
