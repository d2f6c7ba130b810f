#include "image/DocumentDescription.h"

#include <gmock/gmock.h>

#include "json/DocumentText.h"

namespace vantor::analyze {

namespace {

using support::DocumentText;
using ::testing::ElementsAre;
using ::testing::IsEmpty;

class DocumentDescriptionTest : public ::testing::Test {
protected:
    std::optional<PluginDescription> Read(const std::string& text) {
        return ReadDocument(text, {{"dir/x.json", 0, 0}, "/dir/x.json"}, findings);
    }
    // "line:column code: text" of each.
    std::vector<std::string> FoundIn(const std::string& text) {
        findings.clear();
        EXPECT_FALSE(Read(text)) << text;
        std::vector<std::string> texts;
        for (const Finding& finding : findings) {
            texts.push_back(std::to_string(finding.place.line) + ":" +
                            std::to_string(finding.place.column) + " " + finding.code + ": " +
                            finding.text);
        }
        return texts;
    }

    Findings findings;
};

TEST_F(DocumentDescriptionTest, EverythingIsReadWithItsPlace) {
    const std::optional<PluginDescription> plugin =
        Read("{\"metadata\": {\"version\": 3,\n"
             "  \"provides\": [\"a\",\n"
             "    \"b\"], \"requires\": [\"c\"],\n"
             "  \"required_flags\": [\"f\"], \"disabling_flags\": [\"g\"],\n"
             "  \"run_once\": true, \"plugin_version\": \"7\"},\n"
             " \"operations\": {\"apply_host_profile\": [\"x y\"],\n"
             "   \"start\": [\"s t\"]}}");
    EXPECT_THAT(findings, IsEmpty());
    ASSERT_TRUE(plugin);
    EXPECT_EQ(plugin->kind, PluginKind::Json);
    EXPECT_EQ(plugin->apiVersion, 3);
    ASSERT_EQ(plugin->provided.size(), 2U);
    EXPECT_EQ(plugin->provided[1].name, "b");
    EXPECT_EQ(plugin->provided[1].place.path, "dir/x.json");
    EXPECT_EQ(plugin->provided[1].place.line, 3);
    EXPECT_EQ(plugin->provided[1].place.column, 5);
    ASSERT_EQ(plugin->required.size(), 1U);
    EXPECT_EQ(plugin->required[0].place.column, 24);
    EXPECT_THAT(plugin->requiredFlags, ElementsAre("f"));
    EXPECT_THAT(plugin->disablingFlags, ElementsAre("g"));
    EXPECT_TRUE(plugin->runOnce);
    EXPECT_EQ(plugin->pluginVersion, "7");
    ASSERT_EQ(plugin->commands.size(), 2U);
    EXPECT_EQ(plugin->commands[0].text, "s t");
    EXPECT_EQ(plugin->commands[0].place.line, 7);
    EXPECT_EQ(plugin->commands[1].text, "x y");
    EXPECT_EQ(plugin->commands[1].place.line, 6);
}

TEST_F(DocumentDescriptionTest, ARejectionIsTheBootsWithThePlaceOfTheFault) {
    DocumentText document;
    document.metadataText = "{\"version\": 1, \"provides\": [\"a\"],\n\"requires\": [\"b\",\n  7]}";
    EXPECT_THAT(FoundIn(document.Text()),
                ElementsAre("3:3 rejected: plugin `/dir/x.json' is invalid: requires tag is not a "
                            "string"));
}

TEST_F(DocumentDescriptionTest, ACommandThatIsNoTextIsFoundWhereItStands) {
    DocumentText document;
    document.operationsText = "{\"start\": [\"a\"], \"apply_host_profile\":\n[\"b\", [] ]}";
    EXPECT_THAT(FoundIn(document.Text()),
                ElementsAre("2:7 rejected: plugin `/dir/x.json' is invalid: command is not a "
                            "string"));
}

TEST_F(DocumentDescriptionTest, ASyntaxErrorIsFoundWhereReadingStops) {
    EXPECT_THAT(FoundIn("{\"metadata\": {},\n  oops}"),
                ElementsAre("2:3 rejected: plugin `/dir/x.json' is invalid: plugin root is not an "
                            "object"));
}

TEST_F(DocumentDescriptionTest, AMissingPartIsToldAtWhatItIsMissingFrom) {
    EXPECT_THAT(FoundIn(" {}"), ElementsAre("1:2 rejected: plugin `/dir/x.json' is invalid: "
                                            "invalid metadata interface"));
}

TEST_F(DocumentDescriptionTest, AnUnsupportedVersionHasACodeOfItsOwn) {
    EXPECT_THAT(FoundIn("{\"metadata\": {\"version\": 5}}"),
                ElementsAre("1:26 unsupported-version: plugin `/dir/x.json' is invalid: "
                            "Unsupported API version"));
}

TEST_F(DocumentDescriptionTest, ALoneSlashIsFoundBeforeTheReaderHangs) {
    EXPECT_THAT(FoundIn("{\"metadata\":\n / {}}"),
                ElementsAre("2:2 lone-slash: a \"/\" that begins no comment: the boot would read "
                            "it for ever"));
}

TEST_F(DocumentDescriptionTest, NestingThatIsTooDeepIsTold) {
    EXPECT_THAT(FoundIn(std::string(1001, '[')),
                ElementsAre("1:1001 deep-nesting: plugin `/dir/x.json' is invalid: plugin root is "
                            "not an object (nested deeper than 1000 levels)"));
}

TEST_F(DocumentDescriptionTest, ADocumentThatIsMissingIsRejectedAsTheBootDoes) {
    RejectMissingDocument({{"dir/x.json", 0, 0}, "/dir/x.json"}, findings);
    ASSERT_EQ(findings.size(), 1U);
    EXPECT_EQ(findings[0].text, "plugin `/dir/x.json' is invalid: no such file or directory");
}

}  // namespace

}  // namespace vantor::analyze
