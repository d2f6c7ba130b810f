// Documents that are rejected: for which reason, and for which first.

#include <gmock/gmock.h>

#include <algorithm>
#include <boost/filesystem/operations.hpp>
#include <functional>
#include <set>

#include "json/JSONPluginFixture.h"
#include "support/SyslogCapture.h"

namespace vantor {

namespace {

using support::DocumentText;
using support::SyslogCapture;

class JSONPluginRejectionTest : public support::JSONPluginFixture {
protected:
    // Every one of the values is rejected for that reason when it stands under the key.
    void ExpectMetadataRejected(const std::string& key, std::initializer_list<const char*> values,
                                const std::string& reason) const {
        for (const std::string value : values) {
            DocumentText document;
            document.metadata[key] = value;
            EXPECT_EQ(RejectionOf(document), Invalid(reason)) << key << ": " << value;
        }
    }
    void ExpectOperationsRejected(const std::string& key, std::initializer_list<const char*> values,
                                  const std::string& reason) const {
        for (const std::string value : values) {
            DocumentText document;
            document.operations[key] = value;
            EXPECT_EQ(RejectionOf(document), Invalid(reason)) << key << ": " << value;
        }
    }
    void ExpectMetadataMissed(const std::string& key, const std::string& reason) const {
        DocumentText document;
        document.metadata.erase(key);
        EXPECT_EQ(RejectionOf(document), Invalid(reason)) << key;
    }
};

TEST_F(JSONPluginRejectionTest, RootOfAnotherKind) {
    for (const std::string text : {"[]", "42", "\"{}\"", "true ", "null", "x{}", "}{}", ",{}"}) {
        EXPECT_EQ(RejectionOf(text), Invalid("plugin root is not an object")) << text;
    }
}

TEST_F(JSONPluginRejectionTest, EmptyDocument) {
    for (const std::string text : {"", " \n", "/* c */", "// c\n"}) {
        EXPECT_EQ(RejectionOf(text), Invalid("plugin root is not an object")) << text;
    }
}

TEST_F(JSONPluginRejectionTest, ByteOrderMarkIsNoBlank) {
    EXPECT_EQ(RejectionOf("\xef\xbb\xbf" + DocumentText().Text()),
              Invalid("plugin root is not an object"));
}

TEST_F(JSONPluginRejectionTest, SyntaxErrorAnywhere) {
    for (const std::string value : {"nul", "1e999", "{a: 1}", "{\"a\" 1}", "[1 2]", "\"text", "tru",
                                    "{\"a\": 1, , \"b\": 2}", "/* no end", "-"}) {
        DocumentText document;
        document.operations["other"] = value;
        EXPECT_EQ(RejectionOf(document), Invalid("plugin root is not an object")) << value;
    }
}

TEST_F(JSONPluginRejectionTest, DocumentThatIsCutOffAnywhere) {
    DocumentText document;
    document.metadata["provides"] = "[\"a\", \"b\"]";
    const std::string text = document.Text();
    for (std::size_t size = 0; size < text.size(); ++size) {
        EXPECT_EQ(RejectionOf(text.substr(0, size)), Invalid("plugin root is not an object"))
            << text.substr(0, size);
    }
}

TEST_F(JSONPluginRejectionTest, DocumentNestedTooDeeply) {
    DocumentText document;
    document.operations["other"] = std::string(998, '[') + std::string(998, ']');
    EXPECT_EQ(RejectionOf(document), "(no exception)");
    document.operations["other"] = std::string(999, '[') + std::string(999, ']');
    EXPECT_EQ(RejectionOf(document), Invalid("plugin root is not an object"));
    EXPECT_EQ(RejectionOf(std::string(1'000'000, '[')), Invalid("plugin root is not an object"));
}

TEST_F(JSONPluginRejectionTest, MetadataAbsentOrOfAnotherKind) {
    EXPECT_EQ(RejectionOf("{}"), Invalid("invalid metadata interface"));
    EXPECT_EQ(RejectionOf("{\"operations\": {\"start\": []}}"),
              Invalid("invalid metadata interface"));
    for (const std::string value : {"[]", "1", "\"x\"", "true", "null", "x"}) {
        DocumentText document;
        document.metadataText = value;
        EXPECT_EQ(RejectionOf(document), Invalid("invalid metadata interface")) << value;
    }
}

TEST_F(JSONPluginRejectionTest, VersionAbsentOrOfAnotherKind) {
    const std::string reason = "metadata is corrupt (unable to parse version)";
    ExpectMetadataMissed("version", reason);
    ExpectMetadataRejected("version", {"\"2\"", "\"3\"", "[3]", "{}", "true", "null", "x"}, reason);
}

TEST_F(JSONPluginRejectionTest, VersionThatIsNotSupported) {
    ExpectMetadataRejected("version",
                           {"0", "5", "-1", "0.5", "-0.5", "-0", "0.9999", "5.0", "-3", "5e-324"},
                           "Unsupported API version");
}

// None of these becomes a version by losing its upper bits.
TEST_F(JSONPluginRejectionTest, VersionThatNoIntegerHolds) {
    ExpectMetadataRejected("version",
                           {"1e300", "-1e300", "1.7976931348623157e308", "4294967297", "4294967299",
                            "-4294967293", "2147483648", "-2147483649", "18446744073709551619"},
                           "Unsupported API version");
}

TEST_F(JSONPluginRejectionTest, NameListOfAnotherKind) {
    for (const std::string key : {"provides", "requires", "required_flags", "disabling_flags"}) {
        ExpectMetadataRejected(key, {"\"x\"", "{}", "1", "true", "null", "x"},
                               "metadata is corrupt (unable to parse " + key + ")");
    }
}

TEST_F(JSONPluginRejectionTest, NameListThatIsRequiredAndAbsent) {
    for (const std::string key : {"provides", "requires"}) {
        ExpectMetadataMissed(key, "metadata is corrupt (unable to parse " + key + ")");
    }
}

TEST_F(JSONPluginRejectionTest, NameThatIsNotAString) {
    for (const std::string key : {"provides", "requires", "required_flags", "disabling_flags"}) {
        ExpectMetadataRejected(
            key, {"[1]", "[\"rejected-a\", null]", "[[], \"rejected-a\"]", "[{}]", "[true]", "[x]"},
            key + " tag is not a string");
    }
}

TEST_F(JSONPluginRejectionTest, RunOnceAbsentOrOfAnotherKind) {
    const std::string reason = "metadata is corrupt (unable to parse run_once)";
    ExpectMetadataMissed("run_once", reason);
    ExpectMetadataRejected("run_once", {"1", "0", "\"true\"", "null", "[]", "{}", "x"}, reason);
}

TEST_F(JSONPluginRejectionTest, PluginVersionAbsentOrOfAnotherKind) {
    const std::string reason = "metadata is corrupt (unable to parse plugin_version)";
    ExpectMetadataMissed("plugin_version", reason);
    ExpectMetadataRejected("plugin_version", {"1.0", "true", "null", "[]", "{}", "x"}, reason);
}

TEST_F(JSONPluginRejectionTest, VersionFourNeedsWhatVersionThreeNeeds) {
    DocumentText document;
    document.metadata["version"] = "4";
    document.metadata.erase("plugin_version");
    EXPECT_EQ(RejectionOf(document),
              Invalid("metadata is corrupt (unable to parse plugin_version)"));
    document.metadata.erase("run_once");
    EXPECT_EQ(RejectionOf(document), Invalid("metadata is corrupt (unable to parse run_once)"));
}

TEST_F(JSONPluginRejectionTest, OperationsAbsentOrOfAnotherKind) {
    for (const std::string value : {"[]", "1", "\"x\"", "true", "null", "x"}) {
        DocumentText document;
        document.operationsText = value;
        EXPECT_EQ(RejectionOf(document), Invalid("invalid operations interface")) << value;
    }
    EXPECT_EQ(RejectionOf(R"({"metadata": {"version": 1, "provides": [], "requires": []}})"),
              Invalid("invalid operations interface"));
}

TEST_F(JSONPluginRejectionTest, StartAbsentOrOfAnotherKind) {
    const std::string reason = "operations is corrupt (unable to parse start)";
    ExpectOperationsRejected("start", {"\"x\"", "{}", "1", "true", "null", "x"}, reason);
    DocumentText document;
    document.operationsText = "{}";
    EXPECT_EQ(RejectionOf(document), Invalid(reason));
}

TEST_F(JSONPluginRejectionTest, HostProfileCommandsOfAnotherKind) {
    ExpectOperationsRejected("apply_host_profile", {"\"x\"", "{}", "1", "true", "null", "x"},
                             "operations is corrupt (unable to parse apply-host-profile)");
    for (const std::string version : {"2", "4"}) {
        DocumentText document;
        document.metadata["version"] = version;
        document.operations["apply_host_profile"] = "\"x\"";
        EXPECT_EQ(RejectionOf(document),
                  Invalid("operations is corrupt (unable to parse apply-host-profile)"));
    }
}

TEST_F(JSONPluginRejectionTest, CommandThatIsNotAString) {
    for (const std::string key : {"start", "apply_host_profile"}) {
        ExpectOperationsRejected(key, {"[\"a\", 1]", "[null]", "[[]]", "[{}, \"a\"]", "[x]"},
                                 "command is not a string");
    }
}

TEST_F(JSONPluginRejectionTest, TextNamesThePathAsItWasGiven) {
    const std::string odd = folder.Path() + "/./100% `odd' \n.json";
    support::WriteFile(odd, "{}");
    EXPECT_EQ(RejectionOfFile(odd), Invalid(odd, "invalid metadata interface"));
}

TEST_F(JSONPluginRejectionTest, NothingIsLogged) {
    const SyslogCapture log;
    for (const std::string text : {"", "{}", "{\"metadata\": {\"version\": 7}}"}) {
        EXPECT_NE(RejectionOf(text), "(no exception)");
    }
    RejectionOfFile(folder.File("absent.json"));
    EXPECT_TRUE(log.Entries().empty());
}

// One slip, and the reason that it is rejected for.
struct Slip {
    const char* reason;
    std::function<void(DocumentText&)> make;
};

std::function<void(DocumentText&)> Metadata(const char* key, const char* value) {
    return [key, value](DocumentText& document) { document.metadata[key] = value; };
}

std::function<void(DocumentText&)> Operations(const char* key, const char* value) {
    return [key, value](DocumentText& document) { document.operations[key] = value; };
}

// In the order in which they are looked for, each in another key.
std::vector<Slip> SlipsInOrder() {
    return {
        {"metadata is corrupt (unable to parse version)", Metadata("version", "\"3\"")},
        {"metadata is corrupt (unable to parse provides)", Metadata("provides", "7")},
        {"metadata is corrupt (unable to parse requires)", Metadata("requires", "7")},
        {"metadata is corrupt (unable to parse required_flags)", Metadata("required_flags", "7")},
        {"metadata is corrupt (unable to parse disabling_flags)", Metadata("disabling_flags", "7")},
        {"metadata is corrupt (unable to parse run_once)", Metadata("run_once", "7")},
        {"metadata is corrupt (unable to parse plugin_version)", Metadata("plugin_version", "7")},
        {"operations is corrupt (unable to parse start)", Operations("start", "7")},
        {"operations is corrupt (unable to parse apply-host-profile)",
         Operations("apply_host_profile", "7")},
    };
}

// The same keys, wrong in another way.
std::vector<Slip> OtherSlipsInOrder() {
    return {
        {"Unsupported API version", Metadata("version", "7")},
        {"provides tag is not a string", Metadata("provides", "[7]")},
        {"requires tag is not a string", Metadata("requires", "[7]")},
        {"required_flags tag is not a string", Metadata("required_flags", "[7]")},
        {"disabling_flags tag is not a string", Metadata("disabling_flags", "[7]")},
        {"metadata is corrupt (unable to parse run_once)", Metadata("run_once", "\"true\"")},
        {"metadata is corrupt (unable to parse plugin_version)", Metadata("plugin_version", "[]")},
        {"command is not a string", Operations("start", "[\"a\", 7]")},
        {"command is not a string", Operations("apply_host_profile", "[7]")},
    };
}

TEST_F(JSONPluginRejectionTest, FirstOfTwoSlipsIsTheReason) {
    for (const auto& firsts : {SlipsInOrder(), OtherSlipsInOrder()}) {
        for (const auto& seconds : {SlipsInOrder(), OtherSlipsInOrder()}) {
            for (std::size_t first = 0; first < firsts.size(); ++first) {
                for (std::size_t second = first + 1; second < seconds.size(); ++second) {
                    DocumentText document;
                    firsts[first].make(document);
                    seconds[second].make(document);
                    EXPECT_EQ(RejectionOf(document), Invalid(firsts[first].reason))
                        << "and not: " << seconds[second].reason;
                }
            }
        }
    }
}

TEST_F(JSONPluginRejectionTest, MetadataIsLookedAtBeforeOperations) {
    DocumentText document;
    document.operationsText = "7";
    for (const Slip& slip : SlipsInOrder()) {
        DocumentText both = document;
        slip.make(both);
        const bool ofOperations =
            both.operations["start"] == "7" || both.operations["apply_host_profile"] == "7";
        EXPECT_EQ(RejectionOf(both),
                  Invalid(ofOperations ? "invalid operations interface" : slip.reason));
    }
    document.metadataText = "7";
    EXPECT_EQ(RejectionOf(document), Invalid("invalid metadata interface"));
}

TEST_F(JSONPluginRejectionTest, SyntaxErrorComesBeforeEverySlip) {
    EXPECT_EQ(RejectionOf("{\"metadata\": 7, \"operations\": nul}"),
              Invalid("plugin root is not an object"));
}

// The documents that fuzzing begins with.
TEST_F(JSONPluginRejectionTest, KeptCorpusHasADocumentForEveryReason) {
    std::set<std::string> missing;
    for (const auto& slips : {SlipsInOrder(), OtherSlipsInOrder()}) {
        for (const Slip& slip : slips) {
            missing.insert(slip.reason);
        }
    }
    missing.insert({"plugin root is not an object", "invalid metadata interface",
                    "invalid operations interface"});
    const std::string corpus = FUZZ_CORPUS_FOLDER "/document";
    for (const auto& entry : boost::filesystem::directory_iterator(corpus)) {
        const std::string file = entry.path().string();
        const std::string rejection = RejectionOfFile(file);
        const bool rejected = entry.path().filename().string().rfind("reject-", 0) == 0;
        EXPECT_EQ(rejection != "(no exception)", rejected) << file;
        missing.erase(rejection.substr(std::min(rejection.size(), Invalid(file, "").size())));
    }
    EXPECT_THAT(missing, ::testing::IsEmpty());
}

}  // namespace

}  // namespace vantor
