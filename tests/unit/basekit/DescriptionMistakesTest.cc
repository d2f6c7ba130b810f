#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "basekit/DescriptionFolder.h"
#include "basekit/DescriptionLoader.h"

// What can be wrong in a description file, and what is said about it: a table, because the cases
// differ in their texts only.
namespace BaseKit::impl {

namespace {

using vantor::support::DescriptionFolder;

struct Case {
    const char* name;
    std::string content;
    std::vector<std::string> mistakes;  // without the file's name and the ": " behind it
};

void PrintTo(const Case& mistake, std::ostream* stream) { *stream << mistake.name; }

// A file of one command that has all it needs beside `members`, which end with a comma.
std::string Command(const std::string& members) {
    return R"({"commands": [{)" + members + R"("path": "set", "summary": "Sets"}]})";
}

std::string Execute(const std::string& arguments) {
    return Command(R"("options": [{"name": "port", "kind": "integer"},
                                  {"name": "force", "kind": "flag"}],
                      "execute": )" +
                   arguments + ",");
}

std::string Path(const std::string& path) {
    return R"({"commands": [{"path": )" + path + R"(, "summary": "Sets", "execute": ["/x"]}]})";
}

std::string Option(const std::string& option) {
    return Command(R"("execute": ["/x"], "options": [{"name": "first", "letter": "f",
                      "kind": "flag"}, )" +
                   option + "],");
}

const std::string pathRule =
    " is not a command path: at most 16 words with one blank between them, each of letters, "
    "digits, \"-\", \"_\" and \".\", the first a letter or a digit";

const std::string nameRule = " is not an option's name: two or more letters, digits, \"-\", \"_\" "
                             "and \".\", the first a letter or a digit";

const std::string longStringReason =
    "line 1, column 1003: syntax error while parsing object key - invalid string: control "
    "character U+0001 (SOH) must be escaped to \\u0001; last read: '\"";

// clang-format off
const Case documentCases[] = {
    {"EmptyFile", "",
     {"line 1, column 1: syntax error while parsing value - unexpected end of input; "
      "expected '[', '{', or a literal"}},
    {"MissingComma", "{\n  \"commands\": []\n  \"more\": 1\n}",
     {"line 3, column 8: syntax error while parsing object - unexpected string literal; "
      "expected '}'"}},
    {"NotUtf8", "{\"commands\": \"\xff\"}",
     {"line 1, column 15: syntax error while parsing value - invalid string: ill-formed UTF-8 "
      "byte; last read: '\"\xff'"}},
    {"HugeNumber", "{\"commands\": 1e400}", {"number overflow parsing '1e400'"}},
    {"TextBehindTheDocument", "{\"commands\": []} x",
     {"line 1, column 18: syntax error while parsing value - invalid literal; last read: "
      "'\"commands\": []} x'; expected end of input"}},
    {"LongBadString", "{\"" + std::string(1000, 'x') + "\x01\"}",
     {longStringReason + std::string(400 - longStringReason.size(), 'x') + "..."}},
    {"NoObject", "[]", {"must be an object, not an array"}},
    {"NoCommands", "{}", {"the key \"commands\" is missing"}},
    {"CommandsOfAnotherType", R"({"commands": {}})", {"/commands: must be an array, not an object"}},
    {"UnknownKey", R"({"commands": [], "comands": []})", {"the key \"comands\" is not known"}},
    {"KeyTwice", R"({"commands": [], "commands": []})", {"the key \"commands\" stands twice"}},
    {"KeyTwiceDeepInside", R"({"commands": [0, {"options": [1, [], {}, {"name": 1, "name": 2}]}]})",
     {"/commands/1/options/3: the key \"name\" stands twice"}},
    {"KeyTwiceUnderAStrangeKey", R"({"a/b~c": {"x": 1, "x": 2}})",
     {"/a~1b~0c: the key \"x\" stands twice"}},
};

const Case commandCases[] = {
    {"CommandOfAnotherType", R"({"commands": ["set"]})",
     {"/commands/0: must be an object, not a string"}},
    {"AllMissing", R"({"commands": [{}]})",
     {"/commands/0: the key \"path\" is missing",
      "/commands/0: the key \"summary\" is missing",
      "/commands/0: the key \"execute\" is missing"}},
    {"UnknownKeyOfACommand", Command(R"("execute": ["/x"], "name": 1,)"),
     {"/commands/0: the key \"name\" is not known"}},
    {"PathOfAnotherType", Path("null"), {"/commands/0/path: must be a string, not null"}},
    {"EmptyPath", Path(R"("")"), {"/commands/0/path: \"\"" + pathRule}},
    {"TwoBlanksInThePath", Path(R"("a  b")"), {"/commands/0/path: \"a  b\"" + pathRule}},
    {"BlankBehindThePath", Path(R"("a ")"), {"/commands/0/path: \"a \"" + pathRule}},
    {"OptionInThePath", Path(R"("a -b")"), {"/commands/0/path: \"a -b\"" + pathRule}},
    {"StrangeCharacterInThePath", Path(R"("a'b")"), {"/commands/0/path: \"a'b\"" + pathRule}},
    {"SeventeenWords", Path(R"("1 2 3 4 5 6 7 8 9 10 11 12 13 14 15 16 17")"),
     {"/commands/0/path: \"1 2 3 4 5 6 7 8 9 10 11 12 13 14 15 16 17\"" + pathRule}},
    {"SummaryOfAnotherType",
     R"({"commands": [{"path": "set", "summary": true, "execute": ["/x"]}]})",
     {"/commands/0/summary: must be a string, not true or false"}},
    {"EmptySummary", R"({"commands": [{"path": "set", "summary": "", "execute": ["/x"]}]})",
     {"/commands/0/summary: must be one line of text that is not empty"}},
    {"SummaryOfTwoLines",
     R"({"commands": [{"path": "set", "summary": "a\nb", "execute": ["/x"]}]})",
     {"/commands/0/summary: must be one line of text that is not empty"}},
    {"OptionsOfAnotherType", Command(R"("execute": ["/x"], "options": {},)"),
     {"/commands/0/options: must be an array, not an object"}},
};

const Case optionCases[] = {
    {"OptionOfAnotherType", Option("7"), {"/commands/0/options/1: must be an object, not a number"}},
    {"OptionWithNothing", Option("{}"),
     {"/commands/0/options/1: the key \"name\" is missing",
      "/commands/0/options/1: the key \"kind\" is missing"}},
    {"UnknownKeyOfAnOption", Option(R"({"name": "port", "kind": "integer", "default": 1})"),
     {"/commands/0/options/1: the key \"default\" is not known"}},
    {"ShortName", Option(R"({"name": "p", "kind": "integer"})"),
     {"/commands/0/options/1/name: \"p\"" + nameRule}},
    {"NameWithDashes", Option(R"({"name": "--port", "kind": "integer"})"),
     {"/commands/0/options/1/name: \"--port\"" + nameRule}},
    {"NameWithAnEqualsSign", Option(R"({"name": "po=rt", "kind": "integer"})"),
     {"/commands/0/options/1/name: \"po=rt\"" + nameRule}},
    {"NameHelp", Option(R"({"name": "help", "kind": "flag"})"),
     {"/commands/0/options/1/name: \"help\" is an option of every command already"}},
    {"NameTaken", Option(R"({"name": "first", "kind": "flag"})"),
     {"/commands/0/options/1/name: \"first\" is the name of an earlier option already"}},
    {"NoLetter", Option(R"({"name": "port", "letter": "5", "kind": "integer"})"),
     {"/commands/0/options/1/letter: \"5\" is not one letter from a to z or A to Z"}},
    {"TwoLetters", Option(R"({"name": "port", "letter": "po", "kind": "integer"})"),
     {"/commands/0/options/1/letter: \"po\" is not one letter from a to z or A to Z"}},
    {"LetterOfHelp", Option(R"({"name": "port", "letter": "h", "kind": "integer"})"),
     {"/commands/0/options/1/letter: \"h\" asks for help with every command already"}},
    {"LetterTaken", Option(R"({"name": "port", "letter": "f", "kind": "integer"})"),
     {"/commands/0/options/1/letter: \"f\" is the letter of an earlier option already"}},
    {"UnknownKind", Option(R"({"name": "port", "kind": "number", "values": []})"),
     {"/commands/0/options/1/kind: \"number\" is none of \"flag\", \"string\", \"integer\", "
      "\"boolean\" and \"choice\""}},
    {"ChoiceWithoutValues", Option(R"({"name": "port", "kind": "choice"})"),
     {"/commands/0/options/1: the key \"values\" is missing"}},
    {"ChoiceOfNothing", Option(R"({"name": "port", "kind": "choice", "values": []})"),
     {"/commands/0/options/1/values: must list at least one value"}},
    {"BadChoices", Option(R"({"name": "port", "kind": "choice", "values": ["a", 1, "", "a"]})"),
     {"/commands/0/options/1/values/1: must be a string, not a number",
      "/commands/0/options/1/values/2: must be one line of text that is not empty",
      "/commands/0/options/1/values/3: \"a\" stands in the list already"}},
    {"ValuesWithoutAChoice", Option(R"({"name": "port", "kind": "string", "values": ["a"]})"),
     {"/commands/0/options/1/values: only an option of kind \"choice\" lists values"}},
    {"RequiredFlag", Option(R"({"name": "fast", "kind": "flag", "required": true})"),
     {"/commands/0/options/1/required: a flag cannot be required"}},
    {"RequiredOfAnotherType", Option(R"({"name": "port", "kind": "integer", "required": "yes"})"),
     {"/commands/0/options/1/required: must be true or false, not a string"}},
    {"EmptyInteger", Option(R"({"name": "port", "kind": "integer", "allowEmpty": true})"),
     {"/commands/0/options/1/allowEmpty: only the value of an option of kind \"string\" can be "
      "empty"}},
    {"OptionSummaryOfTwoLines", Option(R"({"name": "port", "kind": "integer", "summary": "a\tb"})"),
     {"/commands/0/options/1/summary: must be one line of text"}},
};

const Case executeCases[] = {
    {"ExecuteOfAnotherType", Execute(R"("/bin/true")"),
     {"/commands/0/execute: must be an array, not a string"}},
    {"NothingToExecute", Execute("[]"), {"/commands/0/execute: must name the program to execute"}},
    {"RelativeProgram", Execute(R"(["true"])"),
     {"/commands/0/execute/0: \"true\" is not the absolute path of a program"}},
    {"ProgramWithANull", Execute(R"(["/bin/\u0000"])"),
     {"/commands/0/execute/0: \"/bin/" + std::string(1, '\0') +
      "\" is not the absolute path of a program"}},
    {"ProgramOfAnotherType", Execute(R"([{"when": "force", "arguments": ["/x"]}])"),
     {"/commands/0/execute/0: must be a string, not an object"}},
    {"ArgumentOfAnotherType", Execute(R"(["/x", 5])"),
     {"/commands/0/execute/1: must be a string, or an object with \"when\" and \"arguments\""}},
    {"ArgumentWithANull", Execute(R"(["/x", "a\u0000b"])"),
     {"/commands/0/execute/1: an argument cannot hold a null character"}},
    {"PlaceholderOfNoOption", Execute(R"(["/x", "a${prot}"])"),
     {"/commands/0/execute/1: the placeholder \"${prot}\" names no option"}},
    {"PlaceholderOfAFlag", Execute(R"(["/x", "${force}"])"),
     {"/commands/0/execute/1: the placeholder \"${force}\" names a flag, which has no value: use "
      "\"when\""}},
    {"OpenPlaceholder", Execute(R"(["/x", "a${port"])"),
     {"/commands/0/execute/1: the placeholder \"${port\" is not closed"}},
    {"LoneDollar", Execute(R"(["/x", "$port"])"),
     {"/commands/0/execute/1: a \"$\" that starts no placeholder is written \"$$\""}},
    {"DollarAtTheEnd", Execute(R"(["/x", "port$"])"),
     {"/commands/0/execute/1: a \"$\" that starts no placeholder is written \"$$\""}},
    {"EmptyCondition", Execute(R"(["/x", {}])"),
     {"/commands/0/execute/1: the key \"when\" is missing",
      "/commands/0/execute/1: the key \"arguments\" is missing"}},
    {"BadCondition", Execute(R"(["/x", {"when": "fore", "arguments": [1, "$"], "else": []}])"),
     {"/commands/0/execute/1: the key \"else\" is not known",
      "/commands/0/execute/1/when: \"fore\" names no option",
      "/commands/0/execute/1/arguments/0: must be a string, not a number",
      "/commands/0/execute/1/arguments/1: a \"$\" that starts no placeholder is written \"$$\""}},
};
// clang-format on

class DescriptionMistakesTest : public ::testing::TestWithParam<Case> {};

std::string CaseName(const ::testing::TestParamInfo<Case>& info) { return info.param.name; }

INSTANTIATE_TEST_SUITE_P(Document, DescriptionMistakesTest, ::testing::ValuesIn(documentCases),
                         CaseName);
INSTANTIATE_TEST_SUITE_P(Command, DescriptionMistakesTest, ::testing::ValuesIn(commandCases),
                         CaseName);
INSTANTIATE_TEST_SUITE_P(Option, DescriptionMistakesTest, ::testing::ValuesIn(optionCases),
                         CaseName);
INSTANTIATE_TEST_SUITE_P(Execute, DescriptionMistakesTest, ::testing::ValuesIn(executeCases),
                         CaseName);

TEST_P(DescriptionMistakesTest, AreNamedWithTheirPlaceAndReason) {
    DescriptionFolder folder;
    const std::string name = folder.File("set.json");
    folder.Write("set.json", GetParam().content);

    const DescriptionFile file = ReadDescriptionFile(name);

    std::vector<std::string> expected;
    for (const std::string& mistake : GetParam().mistakes) {
        expected.push_back(name + ": " + mistake);
    }
    EXPECT_EQ(file.mistakes.Texts(), expected);
    EXPECT_THAT(file.commands, ::testing::IsEmpty());
}

}  // namespace

}  // namespace BaseKit::impl
