// The value itself, what a reader does with any first byte, and depth.

#include "json/JsonValue.h"

#include <gtest/gtest.h>

#include <sstream>
#include <type_traits>
#include <utility>

#include "json/JsonReader.h"
#include "json/JsonText.h"

namespace vantor {

namespace {

using support::Accepted;
using support::Failed;
using support::Show;
using support::StateOf;
using support::ValueOf;

// "[[[" and so on, `count` times.
std::string Repeated(const std::string& text, int count) {
    std::string repeated;
    for (int i = 0; i < count; ++i) {
        repeated += text;
    }
    return repeated;
}

TEST(JsonValueTest, FreshValueIsEmptyAndHasNoKind) {
    const JsonValue value;
    EXPECT_EQ(value.text, "");
    EXPECT_EQ(value.number, 0.0);
    EXPECT_TRUE(value.members.empty());
    EXPECT_TRUE(value.elements.empty());
    EXPECT_FALSE(value.flag);
    EXPECT_EQ(value.kind, JsonKind::None);
}

TEST(JsonValueTest, KindsHaveTheirNumbers) {
    EXPECT_TRUE((std::is_same_v<std::underlying_type_t<JsonKind>, std::int32_t>));
    EXPECT_EQ(static_cast<int>(JsonKind::None), 0);
    EXPECT_EQ(static_cast<int>(JsonKind::String), 1);
    EXPECT_EQ(static_cast<int>(JsonKind::Number), 2);
    EXPECT_EQ(static_cast<int>(JsonKind::Object), 3);
    EXPECT_EQ(static_cast<int>(JsonKind::Array), 4);
    EXPECT_EQ(static_cast<int>(JsonKind::Boolean), 5);
    EXPECT_EQ(static_cast<int>(JsonKind::Null), 6);
}

TEST(JsonValueTest, LookUpInsertsAnAbsentMemberWithoutAKind) {
    JsonValue value;
    EXPECT_EQ(value["a"].kind, JsonKind::None);
    EXPECT_EQ(Show(value.members), "{\"a\": none}");
}

TEST(JsonValueTest, LookUpReturnsTheMemberThatIsThere) {
    JsonValue value;
    value.members["a"].kind = JsonKind::Null;
    EXPECT_EQ(&value["a"], &value.members.at("a"));
    EXPECT_EQ(Show(value.members), "{\"a\": null}");
}

TEST(JsonValueTest, FindInsertsNothing) {
    JsonValue value;
    value.members["a"].kind = JsonKind::Null;
    EXPECT_EQ(value.Find("b"), nullptr);
    EXPECT_EQ(value.Find("a"), &value.members.at("a"));
    EXPECT_EQ(value.members.size(), 1U);
}

TEST(JsonValueTest, CopyHoldsEveryMemberAndSharesNothing) {
    JsonValue value;
    value.text = "text";
    value.number = 1.5;
    value.members["m"].elements.resize(2);
    value.elements.resize(1);
    value.elements[0].members["n"].kind = JsonKind::Null;
    value.flag = true;
    value.kind = JsonKind::Array;

    const JsonValue copy = value;
    value.members["m"].elements.clear();
    value.elements[0].members.clear();

    EXPECT_EQ(copy.text, "text");
    EXPECT_EQ(copy.number, 1.5);
    EXPECT_EQ(copy.members.at("m").elements.size(), 2U);
    EXPECT_EQ(Show(copy.elements[0].members), "{\"n\": null}");
    EXPECT_TRUE(copy.flag);
    EXPECT_EQ(copy.kind, JsonKind::Array);
}

TEST(JsonValueTest, EveryOtherFirstByteIsConsumedAndNoFailure) {
    const std::string first = "\"-0123456789{[tfn";
    for (int byte = 0; byte < 256; ++byte) {
        const std::string text(1, static_cast<char>(byte));
        const bool blank = text.find_first_of(" \t\n\v\f\r/") == 0;
        if (!blank && first.find(text) == std::string::npos) {
            EXPECT_EQ(ValueOf(text + "12"), Accepted("none", "12")) << byte;
        }
    }
}

TEST(JsonValueTest, OnlyTheBytesOfTheValueAreConsumed) {
    EXPECT_EQ(ValueOf(" 1 2 "), Accepted("1", " 2 "));
    EXPECT_EQ(ValueOf("\"a\" \"b\""), Accepted("\"a\"", " \"b\""));
    EXPECT_EQ(ValueOf("[1]{}"), Accepted("[1]", "{}"));
}

TEST(JsonValueTest, EndOfInputFails) {
    EXPECT_EQ(ValueOf(""), Failed("none"));
    EXPECT_EQ(ValueOf(" \n"), Failed("none"));
    EXPECT_EQ(ValueOf("/* c */"), Failed("none"));
}

TEST(JsonValueTest, SeveralValuesAreReadOneAfterTheOther) {
    std::istringstream stream("1 [2] \"3\" true null ");
    for (const std::string expected : {"1", "[2]", "\"3\"", "true", "null"}) {
        JsonValue value;
        ReadValue(stream, value);
        EXPECT_EQ(Show(value), expected);
        EXPECT_EQ(StateOf(stream), "read");
    }
}

TEST(JsonValueTest, FailedReadKeepsTheKindThatTheValueHad) {
    std::istringstream stream("[1");
    JsonValue value;
    value.kind = JsonKind::Null;
    ReadValue(stream, value);
    EXPECT_EQ(value.kind, JsonKind::Null);
}

TEST(JsonValueTest, ByteThatBeginsNoValueKeepsTheKindThatTheValueHad) {
    std::istringstream stream("x");
    JsonValue value;
    value.kind = JsonKind::Null;
    ReadValue(stream, value);
    EXPECT_EQ(value.kind, JsonKind::Null);
    EXPECT_EQ(StateOf(stream), "read");
}

TEST(JsonValueTest, ReadSetsTheMemberOfItsKindAlone) {
    std::istringstream stream("[1]");
    JsonValue value;
    value.text = "old";
    value.flag = true;
    ReadValue(stream, value);
    EXPECT_EQ(Show(value), "[1]");
    EXPECT_EQ(value.text, "old");
    EXPECT_TRUE(value.flag);
}

// What opens and what closes a level.
class JsonDepthTest : public ::testing::TestWithParam<std::pair<const char*, const char*>> {
protected:
    static std::string Nested(int levels) {
        return Repeated(GetParam().first, levels) + "1" + Repeated(GetParam().second, levels);
    }
};

constexpr int levelsOfParameter = 2;  // in "[{..}]" and the like
constexpr int deepest = 1000;

TEST_P(JsonDepthTest, ThousandLevelsAreRead) {
    std::istringstream stream(Nested(deepest / levelsOfParameter) + "x");
    JsonValue value;
    ReadValue(stream, value);
    EXPECT_EQ(StateOf(stream), "read");
    EXPECT_NE(value.kind, JsonKind::None);
    EXPECT_EQ(stream.get(), 'x');
}

TEST_P(JsonDepthTest, OneLevelMoreFails) {
    for (const std::string outer : {"[", "{\"k\":"}) {
        std::istringstream stream(outer + Nested(deepest / levelsOfParameter) + "]}");
        JsonValue value;
        ReadValue(stream, value);
        EXPECT_EQ(StateOf(stream), "failed") << outer;
        EXPECT_EQ(value.kind, JsonKind::None) << outer;
    }
}

TEST_P(JsonDepthTest, DeepValueIsCopiedAndFreed) {
    std::istringstream stream(Nested(deepest / levelsOfParameter));
    JsonValue value;
    ReadValue(stream, value);
    const JsonValue copy = value;
    const std::string shown = Show(value);
    value = JsonValue();
    EXPECT_EQ(Show(copy), shown);
}

TEST_P(JsonDepthTest, DepthIsCountedAnewForEveryElement) {
    const std::string deep = Nested(deepest / levelsOfParameter - 1);
    std::istringstream stream("[" + deep + "," + deep + "," + deep + "]");
    JsonValue value;
    ReadValue(stream, value);
    EXPECT_EQ(StateOf(stream), "read");
    EXPECT_EQ(value.elements.size(), 3U);
}

INSTANTIATE_TEST_SUITE_P(ArraysObjectsAndBoth, JsonDepthTest,
                         ::testing::Values(std::make_pair("[[", "]]"),
                                           std::make_pair("{\"k\":{\"k\":", "}}"),
                                           std::make_pair("[{\"k\":", "}]"),
                                           std::make_pair("{\"k\":[", "]}")));

TEST(JsonDepthTest, TooDeepFailsAtTheBracketThatIsOneTooMany) {
    const std::string text = Repeated("[", deepest + 5);
    std::istringstream stream(text);
    JsonValue value;
    ReadValue(stream, value);
    EXPECT_EQ(StateOf(stream), "failed");
    stream.clear();
    EXPECT_EQ(stream.tellg(), std::streampos(deepest + 1));
}

TEST(JsonDepthTest, ReadArrayCountsItsOwnLevel) {
    std::vector<JsonValue> elements;
    std::istringstream deep(Repeated("[", deepest) + Repeated("]", deepest));
    ReadArray(deep, elements);
    EXPECT_EQ(StateOf(deep), "read");
    EXPECT_EQ(elements.size(), 1U);

    std::istringstream deeper(Repeated("[", deepest + 1) + Repeated("]", deepest + 1));
    ReadArray(deeper, elements);
    EXPECT_EQ(StateOf(deeper), "failed");
}

TEST(JsonDepthTest, ReadObjectCountsItsOwnLevel) {
    std::map<std::string, JsonValue> members;
    std::istringstream deep(Repeated("{\"k\":", deepest) + "1" + Repeated("}", deepest));
    ReadObject(deep, members);
    EXPECT_EQ(StateOf(deep), "read");
    EXPECT_EQ(members.size(), 1U);

    std::istringstream deeper(Repeated("{\"k\":", deepest + 1) + "1" + Repeated("}", deepest + 1));
    ReadObject(deeper, members);
    EXPECT_EQ(StateOf(deeper), "failed");
}

TEST(JsonReaderOptionTest, IsOffAtStartAndKeepsWhatItIsSetTo) {
    EXPECT_FALSE(ReaderOption());
    SetReaderOption(true);
    EXPECT_TRUE(ReaderOption());
    SetReaderOption(false);
    EXPECT_FALSE(ReaderOption());
}

TEST(JsonReaderOptionTest, ChangesNothingThatIsRead) {
    SetReaderOption(true);
    const auto with = ValueOf("{\"a\": [1,,\"\\u00e9\"] // c\n}x");
    SetReaderOption(false);
    EXPECT_EQ(ValueOf("{\"a\": [1,,\"\\u00e9\"] // c\n}x"), with);
    EXPECT_EQ(with, Accepted("{\"a\": [1, \"00e9\"]}", "x"));
}

}  // namespace

}  // namespace vantor
