#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "platform/BaseKit.h"

namespace BaseKit::AutoCli {

namespace {

using ::testing::ElementsAre;
using ::testing::IsEmpty;
using ::testing::Pair;

class OptionParserTest : public ::testing::Test {
protected:
    // Parses a line that is a command.
    void Parse(const std::string& line) {
        EXPECT_FALSE(parser.ParseString(line)) << line;
        EXPECT_THAT(parser.GetParseErrors(), IsEmpty()) << line;
    }

    // The sentences for a line that is none.
    std::vector<std::string> Errors(const std::string& line) {
        EXPECT_FALSE(parser.ParseString(line)) << line;
        return parser.GetParseErrors();
    }

    OptionParser parser{"nvcli"};
};

TEST_F(OptionParserTest, WordsUpToTheFirstOptionAreThePath) {
    Parse("network firewall set --port=80");
    EXPECT_THAT(parser.GetCommandPath(), ElementsAre("network", "firewall", "set"));
    EXPECT_THAT(parser.GetCommandParameters(), ElementsAre(Pair("port", "80")));
}

TEST_F(OptionParserTest, ACommandNeedsNoOptions) {
    Parse("ping");
    EXPECT_THAT(parser.GetCommandPath(), ElementsAre("ping"));
    EXPECT_THAT(parser.GetCommandParameters(), IsEmpty());
}

TEST_F(OptionParserTest, EveryFormOfAnOptionIsRead) {
    Parse("set --a1=one --a2 two -b three -cfour --flag -f");
    EXPECT_THAT(parser.GetCommandParameters(),
                ElementsAre(Pair("a1", "one"), Pair("a2", "two"), Pair("b", "three"),
                            Pair("c", "four"), Pair("flag", ""), Pair("f", "")));
}

TEST_F(OptionParserTest, OptionsKeepTheOrderOfTheLineAndMayRepeat) {
    Parse("set --zz=1 --aa=2 --zz=3");
    EXPECT_THAT(parser.GetCommandParameters(),
                ElementsAre(Pair("zz", "1"), Pair("aa", "2"), Pair("zz", "3")));
}

TEST_F(OptionParserTest, AValueMayHoldEqualsSignsAndBeEmpty) {
    Parse("set --a1=x=y --a2= --a3 '' -b=z");
    EXPECT_THAT(parser.GetCommandParameters(),
                ElementsAre(Pair("a1", "x=y"), Pair("a2", ""), Pair("a3", ""), Pair("b", "=z")));
}

TEST_F(OptionParserTest, QuotesMakeOneWordOfAValue) {
    Parse(R"(set --text="two words" --other 'a "b" c' -x\ y)");
    EXPECT_THAT(
        parser.GetCommandParameters(),
        ElementsAre(Pair("text", "two words"), Pair("other", "a \"b\" c"), Pair("x", " y")));
}

TEST_F(OptionParserTest, ADashOrANegativeNumberIsAValue) {
    Parse("set --file - --offset -5 -o -.5");
    EXPECT_THAT(parser.GetCommandParameters(),
                ElementsAre(Pair("file", "-"), Pair("offset", "-5"), Pair("o", "-.5")));
}

TEST_F(OptionParserTest, AnOptionIsNeverTakenForAValue) {
    Parse("set --a1 --a2 -b -c");
    EXPECT_THAT(parser.GetCommandParameters(),
                ElementsAre(Pair("a1", ""), Pair("a2", ""), Pair("b", ""), Pair("c", "")));
}

TEST_F(OptionParserTest, ABlankLineIsNothingToExecute) {
    EXPECT_TRUE(parser.ParseString(""));
    EXPECT_TRUE(parser.ParseString(" \t\n"));
    EXPECT_THAT(parser.GetParseErrors(), IsEmpty());
    EXPECT_THAT(parser.GetCommandPath(), IsEmpty());
}

TEST_F(OptionParserTest, AskingForHelpIsNothingToExecute) {
    for (const char* line : {"network set --help", "network set -h", "network set --port=1 --help",
                             "network set --port -h", "network set -h x"}) {
        EXPECT_TRUE(parser.ParseString(line)) << line;
        EXPECT_THAT(parser.GetCommandPath(), ElementsAre("network", "set")) << line;
    }
    EXPECT_TRUE(parser.ParseString("--help"));
    EXPECT_THAT(parser.GetCommandPath(), IsEmpty());
}

TEST_F(OptionParserTest, HelpIsShownWhateverElseIsWrongWithTheOptions) {
    EXPECT_TRUE(parser.ParseString("set --=x stray --help"));
    EXPECT_THAT(parser.GetParseErrors(), IsEmpty());
}

TEST_F(OptionParserTest, AValueIsNoCallForHelp) {
    Parse("set --text=--help --other '--x=-h'");
    EXPECT_THAT(parser.GetCommandParameters(),
                ElementsAre(Pair("text", "--help"), Pair("other", ""), Pair("x", "-h")));
}

TEST_F(OptionParserTest, HelpTakesNoValue) {
    EXPECT_THAT(Errors("set --help=port"), ElementsAre("the option \"--help\" takes no value"));
    EXPECT_THAT(Errors("set -hport"), ElementsAre("the option \"-h\" takes no value"));
}

TEST_F(OptionParserTest, AnUnterminatedQuoteIsAnError) {
    EXPECT_THAT(
        Errors("set --text='two words"),
        ElementsAre("the word \"--text='two words\" has a single quote that is not closed"));
    EXPECT_THAT(parser.GetCommandPath(), IsEmpty());
}

TEST_F(OptionParserTest, AnOptionWithoutANameIsAnError) {
    EXPECT_THAT(Errors("set --=5"), ElementsAre("the option \"--=5\" has no name"));
    EXPECT_THAT(Errors("set --"), ElementsAre("the option \"--\" has no name"));
    EXPECT_THAT(Errors("set -"), ElementsAre("the option \"-\" has no name"));
    EXPECT_THAT(Errors("set -5"), ElementsAre("the option \"-5\" has no name"));
}

TEST_F(OptionParserTest, AValueWithoutAnOptionIsAnError) {
    EXPECT_THAT(Errors("set --port=80 open"),
                ElementsAre("the value \"open\" belongs to no option"));
    EXPECT_THAT(Errors("set --port 80 -5"), ElementsAre("the value \"-5\" belongs to no option"));
}

TEST_F(OptionParserTest, AnEmptyCommandWordIsAnError) {
    EXPECT_THAT(Errors("network '' set"),
                ElementsAre("the command word after \"network\" is empty"));
    EXPECT_THAT(Errors("\"\" set"),
                ElementsAre("the command line starts with an empty command word"));
}

TEST_F(OptionParserTest, ALineWithoutACommandIsAnError) {
    EXPECT_THAT(Errors("--port=80"),
                ElementsAre("the command line starts with the option \"--port=80\": nvcli needs "
                            "the words of a command before it"));
}

TEST_F(OptionParserTest, EveryErrorOfALineIsNamedInOrder) {
    EXPECT_THAT(
        Errors("network '' --=1 stray --port=80 -hx more"),
        ElementsAre("the command word after \"network\" is empty",
                    "the option \"--=1\" has no name", "the value \"stray\" belongs to no option",
                    "the option \"-h\" takes no value", "the value \"more\" belongs to no option"));
}

TEST_F(OptionParserTest, EachLineStartsAfresh) {
    EXPECT_THAT(Errors("one --a1=1 stray"), testing::SizeIs(1));
    Parse("two");
    EXPECT_THAT(parser.GetCommandPath(), ElementsAre("two"));
    EXPECT_THAT(parser.GetCommandParameters(), IsEmpty());
    EXPECT_TRUE(parser.ParseString("three --help"));
    Parse("four");
}

TEST_F(OptionParserTest, ALineOfTenMegabytesIsReadWhole) {
    const std::string value(10 * 1024 * 1024, 'x');
    Parse("set --text='" + value + "'");
    EXPECT_EQ(parser.GetCommandParameters().at(0).second.size(), value.size());
}

}  // namespace

}  // namespace BaseKit::AutoCli
