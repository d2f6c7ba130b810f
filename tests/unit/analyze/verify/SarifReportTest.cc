#include <gtest/gtest.h>

#include <nlohmann/json.hpp>
#include <set>
#include <sstream>

#include "verify/Codes.h"
#include "verify/Report.h"

namespace vantor::analyze {
namespace {

using Json = nlohmann::json;

Json Sarif(const Findings& findings) {
    std::ostringstream stream;
    WriteSarif(findings, stream, "1.2.3");
    return Json::parse(stream.str());
}

const Findings sample = {{Severity::Error, "no-provider", {"/p/a b%.json", 3, 7}, "first"},
                         {Severity::Warning, "cycle", {"/p/b.so", 0, 0}, "second"},
                         {Severity::Note, "no-provider", {}, "third"}};

TEST(SarifReportTest, IsALogOfOneRunOfThisTool) {
    const Json report = Sarif(sample);
    EXPECT_EQ(report.at("version"), "2.1.0");
    EXPECT_EQ(report.at("$schema"), "https://json.schemastore.org/sarif-2.1.0.json");
    ASSERT_EQ(report.at("runs").size(), 1U);
    const Json& driver = report["runs"][0].at("tool").at("driver");
    EXPECT_EQ(driver.at("name"), "vantor-analyze");
    EXPECT_EQ(driver.at("version"), "1.2.3");
}

// Section 3.27 of SARIF 2.1.0: what a result must have, and may have where it is known.
TEST(SarifReportTest, EachFindingIsAResult) {
    const Json results = Sarif(sample)["runs"][0].at("results");
    EXPECT_EQ(results, Json::parse(R"([
        {"ruleId": "no-provider", "ruleIndex": 1, "level": "error",
         "message": {"text": "first"},
         "locations": [{"physicalLocation": {
             "artifactLocation": {"uri": "file:///p/a%20b%25.json"},
             "region": {"startLine": 3, "startColumn": 7}}}]},
        {"ruleId": "cycle", "ruleIndex": 0, "level": "warning",
         "message": {"text": "second"},
         "locations": [{"physicalLocation": {
             "artifactLocation": {"uri": "file:///p/b.so"}}}]},
        {"ruleId": "no-provider", "ruleIndex": 1, "level": "note",
         "message": {"text": "third"}}])"));
}

TEST(SarifReportTest, EachCodeIsARuleOnce) {
    const Json rules = Sarif(sample)["runs"][0]["tool"]["driver"].at("rules");
    ASSERT_EQ(rules.size(), 2U);
    EXPECT_EQ(rules[0].at("id"), "cycle");
    EXPECT_EQ(rules[0].at("shortDescription").at("text"), DescribeCode("cycle"));
    EXPECT_EQ(rules[1].at("id"), "no-provider");
}

TEST(SarifReportTest, OfNothingHasNoResults) {
    EXPECT_EQ(Sarif({})["runs"][0].at("results"), Json::array());
}

TEST(SarifReportTest, ARelativePathStaysRelative) {
    const Json report = Sarif({{Severity::Error, "x", {"plugins/a.so", 0, 0}, "t"}});
    EXPECT_EQ(report["runs"][0]["results"][0]["locations"][0]["physicalLocation"]
                    ["artifactLocation"]["uri"],
              "plugins/a.so");
    EXPECT_EQ(report["runs"][0]["tool"]["driver"]["rules"][0], Json::parse(R"({"id": "x"})"));
}

}  // namespace
}  // namespace vantor::analyze
