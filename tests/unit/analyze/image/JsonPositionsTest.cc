#include "image/JsonPositions.h"

#include <gtest/gtest.h>

#include <boost/filesystem/operations.hpp>
#include <random>
#include <sstream>

#include "fuzz/ReadingComparison.h"
#include "json/JsonReader.h"
#include "support/TempFolder.h"

namespace vantor::analyze {

namespace {

using End = JsonPositions::End;

// "line:column".
std::string Text(const JsonPositions::Position& position) {
    return std::to_string(position.line) + ":" + std::to_string(position.column);
}

std::string StopOf(const std::string& text, End ending) {
    const JsonPositions positions(text);
    EXPECT_EQ(positions.Ending(), ending) << text;
    return Text(positions.Stop());
}

bool IsReadWell(const std::string& text) {
    std::istringstream stream(text);
    JsonValue value;
    ReadValue(stream, value);
    return !stream.fail();
}

// The reader is not asked about a text that it would read for ever.
void ExpectAgreement(const std::string& text) {
    const End ending = JsonPositions(text).Ending();
    EXPECT_TRUE(ending == End::LoneSlash || IsReadWell(text) == (ending == End::Whole)) << text;
}

TEST(JsonPositionsTest, ElementsOfADocumentAreFoundWhereTheyStand) {
    const JsonPositions positions(
        "// a comment\n{\"metadata\":\n  {\"provides\": [\"a\", /* b */\n\"c\"]}}");
    EXPECT_EQ(positions.Ending(), End::Whole);
    EXPECT_EQ(Text(positions.Of({{}, {}})), "2:1");
    EXPECT_EQ(Text(positions.Of({{"metadata"}, {}})), "3:3");
    EXPECT_EQ(Text(positions.Of({{"metadata", "provides"}, {}})), "3:16");
    EXPECT_EQ(Text(positions.Of({{"metadata", "provides"}, 0})), "3:17");
    EXPECT_EQ(Text(positions.Of({{"metadata", "provides"}, 1})), "4:1");
}

TEST(JsonPositionsTest, OfAMissingValueTheOneAroundItIsFound) {
    const JsonPositions positions("{\n \"metadata\": {\"version\": 1}}");
    EXPECT_EQ(Text(positions.Of({{"metadata", "provides"}, 3})), "2:14");
    EXPECT_EQ(Text(positions.Of({{"operations"}, {}})), "1:1");
    EXPECT_EQ(Text(positions.Of({{"metadata", "version"}, 0})), "2:26");
}

TEST(JsonPositionsTest, OfEqualKeysTheLastOneHolds) {
    const JsonPositions positions("{\"a\": {\"b\": 1}, \"a\": {\"c\": 2}}");
    EXPECT_EQ(Text(positions.Of({{"a"}, {}})), "1:22");
    EXPECT_EQ(Text(positions.Of({{"a", "b"}, {}})), "1:22");
}

TEST(JsonPositionsTest, KeysAreComparedAsTheReaderReadsThem) {
    const JsonPositions positions("{\"a\\/b\": [true]}");
    EXPECT_EQ(Text(positions.Of({{"a/b"}, 0})), "1:11");
}

TEST(JsonPositionsTest, ASyntaxErrorIsFoundWhereReadingStops) {
    EXPECT_EQ(StopOf("", End::Broken), "1:1");
    EXPECT_EQ(StopOf("{\n\"a\" 1}", End::Broken), "2:5");
    EXPECT_EQ(StopOf("{a: 1}", End::Broken), "1:2");
    EXPECT_EQ(StopOf("{\"a\": 1\n \"b\": 2}", End::Broken), "2:2");
    EXPECT_EQ(StopOf("[1, 2}", End::Broken), "1:6");
    EXPECT_EQ(StopOf("{\"a\": nul}", End::Broken), "1:7");
    EXPECT_EQ(StopOf("[\"open]", End::Broken), "1:2");
    EXPECT_EQ(StopOf("[1, /* open", End::Broken), "1:5");
    EXPECT_EQ(StopOf("[1", End::Broken), "1:3");
}

TEST(JsonPositionsTest, ALoneSlashIsFoundWhereverABlankMayStand) {
    EXPECT_EQ(StopOf("/", End::LoneSlash), "1:1");
    EXPECT_EQ(StopOf("{\"a\": 1,\n  / \"b\": 2}", End::LoneSlash), "2:3");
    EXPECT_EQ(StopOf("[1 /]", End::LoneSlash), "1:4");
    EXPECT_EQ(StopOf("{\"a\" /:1}", End::LoneSlash), "1:6");
    EXPECT_EQ(StopOf("{\"a\": / 1}", End::LoneSlash), "1:7");
}

TEST(JsonPositionsTest, ASlashElsewhereIsNone) {
    EXPECT_EQ(JsonPositions("{\"/\": \"/\"}/").Ending(), End::Whole);
    EXPECT_EQ(JsonPositions("[/*/ 1 /* / */ // /\n]").Ending(), End::Whole);
    EXPECT_EQ(JsonPositions("[tru/]").Ending(), End::Broken);
}

TEST(JsonPositionsTest, AsManyLevelsAsTheReaderReadsAreRead) {
    const auto nested = [](std::size_t levels) {
        return std::string(levels, '[') + std::string(levels, ']');
    };
    EXPECT_EQ(JsonPositions(nested(1000)).Ending(), End::Whole);
    EXPECT_TRUE(IsReadWell(nested(1000)));
    EXPECT_EQ(StopOf(nested(1001), End::TooDeep), "1:1001");
    EXPECT_FALSE(IsReadWell(nested(1001)));
    EXPECT_EQ(StopOf(std::string(1000000, '['), End::TooDeep), "1:1001");
}

TEST(JsonPositionsTest, TheReaderGetsAsFarWithEveryKeptInput) {
    int inputs = 0;
    for (const auto& entry : boost::filesystem::recursive_directory_iterator(FUZZ_CORPUS_FOLDER)) {
        const std::string folder = entry.path().parent_path().filename().string();
        if (folder == "reader" || folder == "document") {
            ExpectAgreement(support::ReadFile(entry.path().string()));
            ++inputs;
        }
    }
    EXPECT_GT(inputs, 50);
}

TEST(JsonPositionsTest, TheReaderGetsAsFarWithRandomTexts) {
    static const std::vector<std::string> parts = {
        "{",    "}",   "[", "]",    ",",    ":", "\"a\"", "1", "-",    "true", "false",
        "null", "nul", "/", "/**/", "//\n", " ", "\n",    "x", "\"\\", "1e9",  "+"};
    std::mt19937 random(4711);
    for (int i = 0; i < 20000; ++i) {
        std::string text = i % 2 == 0 ? "{\"a\":" : "[";
        for (std::size_t count = random() % 12; count > 0; --count) {
            text += parts[random() % parts.size()];
        }
        ExpectAgreement(text);
        EXPECT_EQ(JsonPositions(text).Ending() == End::LoneSlash, !support::IsReadToAnEnd(text))
            << text;
    }
}

}  // namespace

}  // namespace vantor::analyze
