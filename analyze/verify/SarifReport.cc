#include <map>
#include <nlohmann/json.hpp>
#include <string>

#include "verify/Codes.h"
#include "verify/Report.h"

namespace vantor::analyze {

namespace {

using Json = nlohmann::ordered_json;

// A file's path as a URI (RFC 3986): whatever is not plain in a path is percent-encoded.
std::string ToUri(const std::string& path) {
    static const std::string plain =
        "abcdefghijklmnopqrstuvwxyzABCDEFGHIJKLMNOPQRSTUVWXYZ0123456789-._~/+,=@";
    constexpr const char* digits = "0123456789ABCDEF";
    std::string uri = path.front() == '/' ? "file://" : "";
    for (const char c : path) {
        if (plain.find(c) != std::string::npos) {
            uri += c;
        } else {
            const auto byte = static_cast<unsigned char>(c);
            uri += {'%', digits[byte / 16], digits[byte % 16]};
        }
    }
    return uri;
}

Json Location(const Place& place) {
    Json physical;
    physical["artifactLocation"]["uri"] = ToUri(place.path);
    if (place.line > 0) {
        physical["region"]["startLine"] = place.line;
        if (place.column > 0) {
            physical["region"]["startColumn"] = place.column;
        }
    }
    Json location;
    location["physicalLocation"] = std::move(physical);
    return location;
}

Json Rule(const std::string& code) {
    Json rule;
    rule["id"] = code;
    if (const std::string description = DescribeCode(code); !description.empty()) {
        rule["shortDescription"]["text"] = description;
    }
    return rule;
}

}  // namespace

void WriteSarif(const Findings& findings, std::ostream& stream, const char* version) {
    std::map<std::string, std::size_t> ruleIndex;
    for (const Finding& finding : findings) {
        ruleIndex.emplace(finding.code, 0);
    }
    Json rules = Json::array();
    for (auto& [code, index] : ruleIndex) {
        index = rules.size();
        rules.push_back(Rule(code));
    }
    Json results = Json::array();
    for (const Finding& finding : findings) {
        Json result;
        result["ruleId"] = finding.code;
        result["ruleIndex"] = ruleIndex[finding.code];
        result["level"] = SeverityName(finding.severity);
        result["message"]["text"] = finding.text;
        if (!finding.place.path.empty()) {
            result["locations"] = Json::array({Location(finding.place)});
        }
        results.push_back(std::move(result));
    }
    Json run;
    Json& driver = run["tool"]["driver"];
    driver["name"] = "vantor-analyze";
    driver["version"] = version;
    driver["rules"] = std::move(rules);
    run["columnKind"] = "unicodeCodePoints";
    run["results"] = std::move(results);
    Json report;
    report["$schema"] = "https://json.schemastore.org/sarif-2.1.0.json";
    report["version"] = "2.1.0";
    report["runs"] = Json::array({std::move(run)});
    stream << report.dump(2, ' ', false, Json::error_handler_t::replace) << '\n';
}

}  // namespace vantor::analyze
