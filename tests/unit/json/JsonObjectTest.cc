#include <gtest/gtest.h>

#include "json/JsonText.h"

namespace vantor {

namespace {

using support::Accepted;
using support::Failed;
using support::ObjectOf;
using support::ValueOf;

TEST(JsonObjectTest, EmptyObject) {
    EXPECT_EQ(ObjectOf("{}"), Accepted("{}"));
    EXPECT_EQ(ObjectOf("{ \n}x"), Accepted("{}", "x"));
}

TEST(JsonObjectTest, MembersAreOrderedByTheBytesOfTheirKeys) {
    EXPECT_EQ(ObjectOf("{\"b\":1,\"\xff\":2,\"a\":3,\"B\":4,\"\":5,\"ab\":6}"),
              Accepted(R"({"": 5, "B": 4, "a": 3, "ab": 6, "b": 1, "\xff": 2})"));
}

TEST(JsonObjectTest, ValuesOfEveryKind) {
    EXPECT_EQ(
        ObjectOf(R"({"a":"s","b":-1.5,"c":{"d":[]},"e":[1,{}],"f":true,"g":false,"h":null})"),
        Accepted(R"({"a": "s", "b": -1.5, "c": {"d": []}, "e": [1, {}], "f": true, "g": false, )"
                 R"("h": null})"));
}

TEST(JsonObjectTest, LastOfEqualKeysWins) {
    EXPECT_EQ(ValueOf(R"({"a": 1, "a": 2})"), Accepted(R"({"a": 2})"));
    EXPECT_EQ(ValueOf(R"({"a": {"x": 1}, "b": 0, "a": {"y": 2}})"),
              Accepted(R"({"a": {"y": 2}, "b": 0})"));
    EXPECT_EQ(ValueOf(R"({"a": 1, "a": ]})"), Accepted(R"({"a": none})"));
}

TEST(JsonObjectTest, KeysAreReadAsStrings) {
    EXPECT_EQ(ObjectOf(R"({"\u0041\n\q": 1})"), Accepted(R"({"0041\x0a\q": 1})"));
}

TEST(JsonObjectTest, AnotherFirstByteFailsAndIsConsumed) {
    EXPECT_EQ(ObjectOf("x{}"), Failed("{}", "{}"));
    EXPECT_EQ(ObjectOf(" {}"), Failed("{}", "{}"));
    EXPECT_EQ(ObjectOf(""), Failed("{}"));
}

TEST(JsonObjectTest, OneCommaMayFollowTheBraceAtOnce) {
    EXPECT_EQ(ObjectOf("{,}"), Accepted("{}"));
    EXPECT_EQ(ObjectOf("{, \"a\":1}"), Accepted("{\"a\": 1}"));
    EXPECT_EQ(ObjectOf("{ ,}"), Failed("{}", "}"));
    EXPECT_EQ(ObjectOf("{,,}"), Failed("{}", "}"));
}

TEST(JsonObjectTest, OneCommaMayFollowACommaAtOnce) {
    EXPECT_EQ(ObjectOf("{\"a\":1,,\"b\":2}"), Accepted("{\"a\": 1, \"b\": 2}"));
    EXPECT_EQ(ObjectOf("{\"a\":1,,}"), Accepted("{\"a\": 1}"));
    EXPECT_EQ(ObjectOf("{\"a\":1, ,\"b\":2}"), Failed("{\"a\": 1}", "\"b\":2}"));
    EXPECT_EQ(ObjectOf("{\"a\":1,/**/,\"b\":2}"), Failed("{\"a\": 1}", "\"b\":2}"));
    EXPECT_EQ(ObjectOf("{\"a\":1,,,\"b\":2}"), Failed("{\"a\": 1}", "\"b\":2}"));
}

TEST(JsonObjectTest, TrailingCommaIsAccepted) {
    EXPECT_EQ(ObjectOf("{\"a\":1,}"), Accepted("{\"a\": 1}"));
    EXPECT_EQ(ObjectOf("{\"a\":1 , }x"), Accepted("{\"a\": 1}", "x"));
}

TEST(JsonObjectTest, MissingCommaFailsAtTheNextMember) {
    EXPECT_EQ(ObjectOf("{\"a\":1 \"b\":2}"), Failed("{\"a\": 1}", "b\":2}"));
}

TEST(JsonObjectTest, UnquotedKeyFails) {
    EXPECT_EQ(ObjectOf("{a: 1}"), Failed("{}", ": 1}"));
    EXPECT_EQ(ValueOf("{a: 1}"), Failed("none", ": 1}"));
    EXPECT_EQ(ObjectOf("{1: 1}"), Failed("{}", ": 1}"));
    EXPECT_EQ(ObjectOf("{]"), Failed("{}"));
}

TEST(JsonObjectTest, MissingColonFails) {
    EXPECT_EQ(ObjectOf("{\"a\" 1}"), Failed("{}", "}"));
    EXPECT_EQ(ValueOf("{\"a\" 1}"), Failed("none", "}"));
    EXPECT_EQ(ObjectOf("{\"a\", \"b\": 1}"), Failed("{}", " \"b\": 1}"));
    EXPECT_EQ(ObjectOf("{\"a\"}"), Failed("{}"));
}

TEST(JsonObjectTest, MemberWithoutAValueSwallowsTheNextByte) {
    EXPECT_EQ(ObjectOf("{\"a\":}}x"), Accepted("{\"a\": none}", "x"));
    EXPECT_EQ(ObjectOf("{\"a\":}"), Failed("{\"a\": none}"));
    EXPECT_EQ(ObjectOf("{\"a\":,\"b\":1}"), Failed("{\"a\": none}", "b\":1}"));
    EXPECT_EQ(ObjectOf("{\"a\":,,\"b\":1}"), Accepted("{\"a\": none, \"b\": 1}"));
    EXPECT_EQ(ObjectOf("{\"a\":+,\"b\":x}"), Accepted("{\"a\": none, \"b\": none}"));
}

TEST(JsonObjectTest, ReplacesItsOutputAlsoAfterAFailure) {
    EXPECT_EQ(ObjectOf("{\"a\":1,\"b\":nul}"), Failed("{\"a\": 1, \"b\": none}"));
    EXPECT_EQ(ObjectOf("{\"a\":1,\"b\""), Failed("{\"a\": 1}"));
    EXPECT_EQ(ObjectOf("{\"a\":1,\"b\":"), Failed("{\"a\": 1, \"b\": none}"));
    EXPECT_EQ(ObjectOf("{\"a\":1,\"a\":"), Failed("{\"a\": none}"));
    EXPECT_EQ(ObjectOf("{\"a\":1"), Failed("{\"a\": 1}"));
    EXPECT_EQ(ObjectOf("{"), Failed("{}"));
}

TEST(JsonObjectTest, UnendedMemberObjectIsAMemberWithoutAKind) {
    EXPECT_EQ(ObjectOf("{\"a\":{\"b\":1"), Failed("{\"a\": none}"));
}

TEST(JsonObjectTest, AnotherClosingByteFailsAndIsConsumed) {
    EXPECT_EQ(ObjectOf("{\"a\":1]x"), Failed("{\"a\": 1}", "x"));
    EXPECT_EQ(ObjectOf("{\"a\":1:2}"), Failed("{\"a\": 1}", "2}"));
}

TEST(JsonObjectTest, NothingBehindTheClosingBraceIsRead) {
    EXPECT_EQ(ValueOf("{} }garbage"), Accepted("{}", " }garbage"));
    EXPECT_EQ(ValueOf("{\"a\":[1]}/"), Accepted("{\"a\": [1]}", "/"));
}

TEST(JsonObjectTest, FailedReadLeavesAValueWithoutAKind) {
    EXPECT_EQ(ValueOf("{\"a\": 1"), Failed("none"));
    EXPECT_EQ(ValueOf("{"), Failed("none"));
    EXPECT_EQ(ValueOf("{\"a\": {\"b\": 1}"), Failed("none"));
}

}  // namespace

}  // namespace vantor
