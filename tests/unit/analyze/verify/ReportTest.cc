#include "verify/Report.h"

#include <gtest/gtest.h>

#include <nlohmann/json.hpp>
#include <sstream>

namespace vantor::analyze {
namespace {

std::string Text(const Findings& findings, bool colour = false) {
    std::ostringstream stream;
    WriteText(findings, stream, colour);
    return stream.str();
}

std::string JsonText(const Findings& findings) {
    std::ostringstream stream;
    WriteJson(findings, stream);
    return stream.str();
}

TEST(ReportTest, LeavesOutWhatIsNotKnownOfAPlace) {
    EXPECT_EQ(Text({{Severity::Error, "x", {"/p", 3, 7}, "a"},
                    {Severity::Warning, "x", {"/p", 3, 0}, "b"},
                    {Severity::Note, "x", {"/p", 0, 7}, "c"},
                    {Severity::Note, "x", {}, "d"}}),
              "/p:3:7: error[x]: a\n/p:3: warning[x]: b\n/p: note[x]: c\nnote[x]: d\n");
}

TEST(ReportTest, KeepsAFindingOnItsLine) {
    EXPECT_EQ(Text({{Severity::Error, "x", {"/p\n", 0, 0}, "a\tb\x1b[0m\x7f"}}),
              "/p\\x0a: error[x]: a\\x09b\\x1b[0m\\x7f\n");
}

TEST(ReportTest, ColoursThePlaceAndTheSeverity) {
    EXPECT_EQ(Text({{Severity::Error, "x", {"/p", 0, 0}, "a"}}, true),
              "\x1b[1m/p:\x1b[0m \x1b[1;31merror[x]:\x1b[0m a\n");
}

TEST(ReportTest, SortsByPlaceCodeAndText) {
    Findings findings = {
        {Severity::Error, "b", {"/p", 2, 1}, "t"}, {Severity::Error, "b", {"/p", 1, 2}, "u"},
        {Severity::Error, "b", {"/p", 1, 2}, "t"}, {Severity::Note, "a", {"/p", 1, 2}, "z"},
        {Severity::Error, "b", {"/p", 1, 1}, "t"}, {Severity::Error, "b", {"/o", 9, 9}, "t"},
        {Severity::Error, "b", {"/p", 10, 0}, "t"}};
    SortFindings(findings);
    EXPECT_EQ(Text(findings), "/o:9:9: error[b]: t\n/p:1:1: error[b]: t\n/p:1:2: note[a]: z\n"
                              "/p:1:2: error[b]: t\n/p:1:2: error[b]: u\n/p:2:1: error[b]: t\n"
                              "/p:10: error[b]: t\n");
}

TEST(ReportTest, SaysTheSameOnlyOnce) {
    Findings findings = {{Severity::Error, "b", {"/p", 1, 1}, "t"},
                         {Severity::Error, "b", {"/p", 1, 1}, "t"},
                         {Severity::Note, "b", {"/p", 1, 1}, "t"}};
    SortFindings(findings);
    EXPECT_EQ(findings.size(), 2U);
}

TEST(ReportTest, StrictMakesWarningsErrorsAndLeavesNotes) {
    Findings findings = {{Severity::Warning, "b", {}, "t"}, {Severity::Note, "b", {}, "t"}};
    MakeStrict(findings);
    const FindingCounts counts = CountFindings(findings);
    EXPECT_EQ(counts.errors, 1U);
    EXPECT_EQ(counts.warnings, 0U);
    EXPECT_EQ(counts.notes, 1U);
}

TEST(ReportTest, JsonHoldsWhatIsKnown) {
    EXPECT_EQ(nlohmann::json::parse(JsonText({{Severity::Error, "x", {"/p", 3, 7}, "a"},
                                              {Severity::Warning, "y", {"/q", 0, 0}, "b"},
                                              {Severity::Note, "z", {}, "c"}})),
              nlohmann::json::parse(R"({
                  "findings": [
                      {"severity": "error", "code": "x", "path": "/p", "line": 3, "column": 7,
                       "text": "a"},
                      {"severity": "warning", "code": "y", "path": "/q", "text": "b"},
                      {"severity": "note", "code": "z", "text": "c"}],
                  "summary": {"errors": 1, "warnings": 1, "notes": 1}})"));
}

TEST(ReportTest, JsonOfNothingIsAnEmptyList) {
    EXPECT_EQ(nlohmann::json::parse(JsonText({})), nlohmann::json::parse(R"({"findings": [],
                  "summary": {"errors": 0, "warnings": 0, "notes": 0}})"));
}

TEST(ReportTest, JsonStaysJsonWhateverBytesNamesHold) {
    const auto report =
        nlohmann::json::parse(JsonText({{Severity::Error, "x", {"/\xff", 0, 0}, "\n"}}));
    EXPECT_EQ(report["findings"][0]["path"], "/\xef\xbf\xbd");
    EXPECT_EQ(report["findings"][0]["text"], "\n");
}

}  // namespace
}  // namespace vantor::analyze
