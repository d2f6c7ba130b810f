#include "basekit/Tokenizer.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

namespace BaseKit::impl {

namespace {

using ::testing::ElementsAre;
using ::testing::ElementsAreArray;
using ::testing::IsEmpty;

TEST(TokenizerTest, BlanksTabsAndLineEndsSeparateWords) {
    EXPECT_THAT(Tokenize(" one two\tthree\r\nfour \v\f ").words,
                ElementsAre("one", "two", "three", "four"));
}

TEST(TokenizerTest, ABlankLineHasNoWords) {
    EXPECT_THAT(Tokenize("").words, IsEmpty());
    EXPECT_THAT(Tokenize(" \t\n").words, IsEmpty());
    EXPECT_EQ(Tokenize(" \t\n").error, "");
}

TEST(TokenizerTest, SingleQuotesKeepEverything) {
    EXPECT_THAT(Tokenize(R"('a  b' '"' '\' 'c\')").words, ElementsAre("a  b", "\"", "\\", "c\\"));
}

TEST(TokenizerTest, DoubleQuotesKeepEverythingButFourEscapes) {
    EXPECT_THAT(Tokenize(R"("a  b" "it's" "\"\\\$\`" "\n\a\ ")").words,
                ElementsAre("a  b", "it's", "\"\\$`", "\\n\\a\\ "));
}

TEST(TokenizerTest, ABackslashKeepsTheNextCharacter) {
    EXPECT_THAT(Tokenize(R"(a\ b \" \' \\ \n)").words, ElementsAre("a b", "\"", "'", "\\", "n"));
}

TEST(TokenizerTest, ABackslashTakesTheLineEndAway) {
    EXPECT_THAT(Tokenize("one\\\ntwo \\\n \"three\\\nfour\" 'five\\\nsix'").words,
                ElementsAre("onetwo", "threefour", "five\\\nsix"));
}

TEST(TokenizerTest, PartsWithoutABlankBetweenThemMakeOneWord) {
    EXPECT_THAT(Tokenize(R"(--name='a b'"c d"e\ f)").words, ElementsAre("--name=a bc de f"));
}

TEST(TokenizerTest, EmptyQuotesAreAnEmptyWord) {
    EXPECT_THAT(Tokenize(R"('' a "" b''"")").words, ElementsAre("", "a", "", "b"));
}

TEST(TokenizerTest, NothingElseOfAShellIsSpecial) {
    EXPECT_THAT(Tokenize("$HOME * ~ #no `id` $(id) ; | & > < ! {a,b} [c]").words,
                ElementsAre("$HOME", "*", "~", "#no", "`id`", "$(id)", ";", "|", "&", ">", "<", "!",
                            "{a,b}", "[c]"));
}

TEST(TokenizerTest, BytesBeyondAsciiAreLettersLikeAnyOther) {
    EXPECT_THAT(Tokenize("gr\xc3\xbc\xc3\x9f \xff\xa0").words,
                ElementsAre("gr\xc3\xbc\xc3\x9f", "\xff\xa0"));
}

struct BadLine {
    std::string line;
    std::string error;
};

TEST(TokenizerTest, AWordThatCannotBeReadIsNamedToTheEndOfTheLine) {
    const BadLine lines[] = {
        {"one 'two three", "the word \"'two three\" has a single quote that is not closed"},
        {"one x\"two ' three", "the word \"x\"two ' three\" has a double quote that is not closed"},
        {"one \"two\\\"", "the word \"\"two\\\"\" has a double quote that is not closed"},
        {"one two\\", "the word \"two\\\" has a backslash with nothing after it"},
        {std::string("one\0two", 7), "the command line has a null character"},
    };
    for (const BadLine& bad : lines) {
        const Tokens tokens = Tokenize(bad.line);
        EXPECT_EQ(tokens.error, bad.error);
        EXPECT_THAT(tokens.words, IsEmpty());
    }
}

TEST(TokenizerTest, ALongWordIsNamedByItsBeginning) {
    EXPECT_EQ(Tokenize("'" + std::string(1000, 'x')).error,
              "the word \"'" + std::string(199, 'x') +
                  "...\" has a single quote that is not closed");
}

// The cut never leaves half a character behind.
TEST(TokenizerTest, ALongWordIsCutBetweenCharacters) {
    std::string word = "'";
    for (int i = 0; i < 200; ++i) {
        word += "\xe2\x82\xac";
    }
    EXPECT_EQ(Tokenize(word).error,
              "the word \"" + word.substr(0, 199) + "...\" has a single quote that is not closed");
}

TEST(TokenizerTest, AQuotedWordIsReadAsThatWord) {
    const std::vector<std::string> words = {"plain", "",    "two words", "it's",   "\"",
                                            "\\",    "a\n", "$x",        "'''\\'", "#"};
    std::string line;
    for (const std::string& word : words) {
        line += QuoteWord(word) + " ";
    }
    EXPECT_THAT(Tokenize(line).words, ElementsAreArray(words));
}

TEST(TokenizerTest, AWordThatCanIsQuotedBare) { EXPECT_EQ(QuoteWord("--a=$b"), "--a=$b"); }

}  // namespace

}  // namespace BaseKit::impl
