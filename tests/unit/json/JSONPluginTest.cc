// Documents that are accepted, and what becomes of every key.

#include "json/JSONPlugin.h"

#include <gmock/gmock.h>

#include "json/JSONPluginFixture.h"
#include "json/JsonReader.h"

namespace vantor {

namespace {

using namespace std::string_literals;
using support::DocumentText;
using ::testing::ElementsAre;
using ::testing::IsEmpty;

class JSONPluginTest : public support::JSONPluginFixture {};

DocumentText OfVersion(const std::string& version) {
    DocumentText document;
    document.metadata["version"] = version;
    return document;
}

// Nothing but the keys that version 1 must have.
DocumentText Smallest(const std::string& version) {
    DocumentText document;
    document.metadata = {{"version", version}, {"provides", "[]"}, {"requires", "[]"}};
    document.operations = {{"start", "[]"}};
    return document;
}

TEST_F(JSONPluginTest, CompleteDocumentFillsEveryField) {
    const auto plugin = Load(R"({
        "metadata": {
            "version": 3,
            "provides": ["network-configured"],
            "requires": ["storage-ready", "config-loaded"],
            "required_flags": [],
            "disabling_flags": ["nonet"],
            "run_once": false,
            "plugin_version": "1.0.2"
        },
        "operations": {
            "start": ["system module load --module=netdrv", "network firewall refresh"],
            "apply_host_profile": ["network firewall refresh"]
        }
    }
    )");
    EXPECT_EQ(plugin->Name(), "netcfg");
    EXPECT_EQ(plugin->ApiVersion(), 3);
    EXPECT_THAT(plugin->RequiredFlags(), IsEmpty());
    EXPECT_THAT(plugin->DisablingFlags(), ElementsAre("nonet"));
    EXPECT_FALSE(plugin->RunOnce());
    EXPECT_EQ(plugin->PluginVersion(), "1.0.2");
    EXPECT_THAT(plugin->StartCommands(),
                ElementsAre("system module load --module=netdrv", "network firewall refresh"));
    EXPECT_THAT(plugin->ApplyHostProfileCommands(), ElementsAre("network firewall refresh"));
}

TEST_F(JSONPluginTest, NewPluginIsAnIdleNodeThatHasNotRun) {
    const auto plugin = Load(DocumentText());
    EXPECT_EQ(plugin->State(), NodeState::Idle);
    EXPECT_EQ(plugin->StartTime().tv_sec, 0);
    EXPECT_EQ(plugin->EndTime().tv_sec, 0);
    EXPECT_EQ(plugin->DotAttributes(), "");
}

TEST_F(JSONPluginTest, VersionIsTruncatedTowardZero) {
    const std::pair<const char*, int> versions[] = {
        {"1", 1},     {"2", 2},        {"3", 3},   {"4", 4},
        {"1.9", 1},   {"2.999999", 2}, {"4.7", 4}, {"4.999999999999999", 4},
        {"10e-1", 1}, {"0.3e1", 3},
    };
    for (const auto& [text, version] : versions) {
        EXPECT_EQ(Load(OfVersion(text))->ApiVersion(), version) << text;
    }
}

TEST_F(JSONPluginTest, SmallestDocumentsOfVersionsOneAndTwo) {
    for (const std::string version : {"1", "2"}) {
        const auto plugin = Load(Smallest(version));
        EXPECT_FALSE(plugin->RunOnce());
        EXPECT_EQ(plugin->PluginVersion(), "");
        EXPECT_THAT(plugin->RequiredFlags(), IsEmpty());
        EXPECT_THAT(plugin->DisablingFlags(), IsEmpty());
        EXPECT_THAT(plugin->StartCommands(), IsEmpty());
        EXPECT_THAT(plugin->ApplyHostProfileCommands(), IsEmpty());
    }
}

TEST_F(JSONPluginTest, FlagsAreOptionalFromVersionThree) {
    for (const std::string version : {"3", "4"}) {
        DocumentText document = Smallest(version);
        document.metadata["run_once"] = "true";
        document.metadata["plugin_version"] = "\"2\"";
        const auto plugin = Load(document);
        EXPECT_TRUE(plugin->RunOnce());
        EXPECT_EQ(plugin->PluginVersion(), "2");
        EXPECT_THAT(plugin->RequiredFlags(), IsEmpty());
        EXPECT_THAT(plugin->DisablingFlags(), IsEmpty());
    }
}

TEST_F(JSONPluginTest, FlagsAreSets) {
    DocumentText document;
    document.metadata["required_flags"] = R"(["b", "a", "b"])";
    document.metadata["disabling_flags"] = R"(["z", "", "y", "z"])";
    const auto plugin = Load(document);
    EXPECT_THAT(plugin->RequiredFlags(), ElementsAre("a", "b"));
    EXPECT_THAT(plugin->DisablingFlags(), ElementsAre("", "y", "z"));
}

TEST_F(JSONPluginTest, RunOnceAndPluginVersionAreTaken) {
    DocumentText document;
    document.metadata["run_once"] = "true";
    document.metadata["plugin_version"] = R"("1.0, \"beta\"")";
    const auto plugin = Load(document);
    EXPECT_TRUE(plugin->RunOnce());
    EXPECT_EQ(plugin->PluginVersion(), "1.0, \"beta\"");
}

TEST_F(JSONPluginTest, PluginVersionMayBeEmpty) {
    DocumentText document;
    document.metadata["plugin_version"] = "\"\"";
    EXPECT_EQ(Load(document)->PluginVersion(), "");
}

TEST_F(JSONPluginTest, CommandsKeepTheirOrderAndTheirRepetitions) {
    DocumentText document;
    document.operations["start"] = R"(["b", "a", "", "b"])";
    document.operations["apply_host_profile"] = R"(["d", "c", "d"])";
    const auto plugin = Load(document);
    EXPECT_THAT(plugin->StartCommands(), ElementsAre("b", "a", "", "b"));
    EXPECT_THAT(plugin->ApplyHostProfileCommands(), ElementsAre("d", "c", "d"));
}

TEST_F(JSONPluginTest, CommandsKeepEveryByte) {
    DocumentText document;
    document.operations["start"] = "[\"a\0\x01\xff\\u00e9\\q\\\"\"]"s;
    EXPECT_THAT(Load(document)->StartCommands(), ElementsAre("a\0\x01\xff"
                                                             "00e9\\q\""s));
}

TEST_F(JSONPluginTest, VersionFourIsReadLikeVersionThree) {
    DocumentText document = OfVersion("4");
    document.metadata["required_flags"] = "[\"f\"]";
    document.metadata["run_once"] = "true";
    document.operations["apply_host_profile"] = "[\"c\"]";
    const auto plugin = Load(document);
    EXPECT_THAT(plugin->RequiredFlags(), ElementsAre("f"));
    EXPECT_TRUE(plugin->RunOnce());
    EXPECT_EQ(plugin->PluginVersion(), "1");
    EXPECT_THAT(plugin->ApplyHostProfileCommands(), ElementsAre("c"));
}

// Whatever stands under a key of a later version, and if it stands there at all, is not looked at.
TEST_F(JSONPluginTest, KeysOfVersionThreeAreNotLookedAtBelowIt) {
    for (const std::string version : {"1", "2", "2.9"}) {
        for (const std::string key :
             {"required_flags", "disabling_flags", "run_once", "plugin_version"}) {
            for (const std::string value : {"7", "null", "{}", "[1]", "\"x\"", "true", "[\"f\"]"}) {
                DocumentText document = OfVersion(version);
                document.metadata[key] = value;
                const auto plugin = Load(document);
                EXPECT_THAT(plugin->RequiredFlags(), IsEmpty()) << version << key << value;
                EXPECT_THAT(plugin->DisablingFlags(), IsEmpty()) << version << key << value;
                EXPECT_FALSE(plugin->RunOnce()) << version << key << value;
                EXPECT_EQ(plugin->PluginVersion(), "") << version << key << value;
            }
        }
    }
}

TEST_F(JSONPluginTest, HostProfileCommandsAreNotLookedAtInVersionOne) {
    for (const std::string value : {"\"x\"", "7", "null", "{}", "[1]", "[\"c\"]"}) {
        DocumentText document = OfVersion("1.9");
        document.operations["apply_host_profile"] = value;
        EXPECT_THAT(Load(document)->ApplyHostProfileCommands(), IsEmpty()) << value;
    }
}

TEST_F(JSONPluginTest, HostProfileCommandsAreReadFromVersionTwo) {
    for (const std::string version : {"2", "3", "4"}) {
        DocumentText document = OfVersion(version);
        document.operations["apply_host_profile"] = "[\"c\"]";
        EXPECT_THAT(Load(document)->ApplyHostProfileCommands(), ElementsAre("c")) << version;
    }
}

TEST_F(JSONPluginTest, EveryOtherKeyIsIgnored) {
    DocumentText document;
    document.metadata["Version"] = "99";
    document.metadata["start"] = "[1]";
    document.metadata[""] = "}";
    document.operations["stop"] = "[1]";
    document.operations["apply-host-profile"] = "7";
    std::string text = document.Text();
    text.insert(1, "\"other\": {\"metadata\": 1, \"deep\": [[[{}]]]}, \"\": null,");
    EXPECT_EQ(Load(text)->ApiVersion(), 3);
}

TEST_F(JSONPluginTest, LastOfEqualKeysWinsAtEveryLevel) {
    const auto plugin = Load(R"({
        "metadata": 7,
        "operations": {"start": ["a"]},
        "metadata": {"version": 9, "provides": 1, "version": 1, "provides": [], "requires": []},
        "operations": {"start": 7, "start": ["b"]}
    })");
    EXPECT_EQ(plugin->ApiVersion(), 1);
    EXPECT_THAT(plugin->StartCommands(), ElementsAre("b"));
}

TEST_F(JSONPluginTest, CommentMayStandBeforeTheRootObject) {
    const std::string text = DocumentText().Text();
    EXPECT_EQ(Load("// a line\n/* a block */ " + text)->ApiVersion(), 3);
}

TEST_F(JSONPluginTest, NothingBehindTheRootObjectIsLookedAt) {
    const std::string text = DocumentText().Text();
    for (const std::string garbage : {"garbage", "}", "{", "/", "/* no end", "[1", "\xff"}) {
        EXPECT_EQ(Load(text + garbage)->ApiVersion(), 3) << garbage;
    }
}

TEST_F(JSONPluginTest, CommentsAndLooseCommasMayStandInsideTheDocument) {
    const auto plugin = Load(R"({, // the root
        "metadata": {"version": /* of the format */ 1, "provides": [,], "requires": [ ], },
        "operations": {"start": ["a",, "b", // the last
        ]},})");
    EXPECT_THAT(plugin->StartCommands(), ElementsAre("a", "b"));
}

TEST_F(JSONPluginTest, LargeDocumentIsReadWhole) {
    std::string commands = "[";
    for (int i = 0; i < 50000; ++i) {
        commands += "\"command " + std::to_string(i) + "\",";
    }
    DocumentText document;
    document.operations["start"] = commands + "]";
    const auto plugin = Load(document);
    EXPECT_EQ(plugin->StartCommands().size(), 50000U);
    EXPECT_EQ(plugin->StartCommands().back(), "command 49999");
}

class JSONPluginReaderOptionTest : public JSONPluginTest {
protected:
    JSONPluginReaderOptionTest() { SetReaderOption(false); }
    ~JSONPluginReaderOptionTest() override { SetReaderOption(false); }
};

TEST_F(JSONPluginReaderOptionTest, IsSetByEveryDocumentAndNeverCleared) {
    Load(DocumentText());
    EXPECT_TRUE(ReaderOption());
    Load(DocumentText());
    EXPECT_TRUE(ReaderOption());
}

TEST_F(JSONPluginReaderOptionTest, IsSetBeforeTheDocumentIsParsed) {
    RejectionOf("nonsense");
    EXPECT_TRUE(ReaderOption());
}

TEST_F(JSONPluginReaderOptionTest, IsNotSetByADocumentThatCannotBeOpened) {
    RejectionOfFile(folder.File("absent.json"));
    EXPECT_FALSE(ReaderOption());
}

}  // namespace

}  // namespace vantor
