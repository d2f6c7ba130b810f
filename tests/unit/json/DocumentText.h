#ifndef VANTOR_JSON_TESTS_DOCUMENTTEXT_H
#define VANTOR_JSON_TESTS_DOCUMENTTEXT_H

#include <map>
#include <string>

namespace vantor::support {

// The text of a plugin document. A fresh one is valid, of version 3 and has every key; a test
// changes or erases what it is about.
struct DocumentText {
    // Key to value, the value as it is to stand in the document.
    std::map<std::string, std::string> metadata = {
        {"version", "3"},
        {"provides", "[]"},
        {"requires", "[]"},
        {"required_flags", "[]"},
        {"disabling_flags", "[]"},
        {"run_once", "false"},
        {"plugin_version", "\"1\""},
    };
    std::map<std::string, std::string> operations = {
        {"start", "[]"},
        {"apply_host_profile", "[]"},
    };
    // These, if not empty, stand in place of the whole object.
    std::string metadataText;
    std::string operationsText;

    std::string Text() const {
        return "{\"metadata\": " + (metadataText.empty() ? Object(metadata) : metadataText) +
               ", \"operations\": " +
               (operationsText.empty() ? Object(operations) : operationsText) + "}";
    }

private:
    static std::string Object(const std::map<std::string, std::string>& members) {
        std::string text = "{";
        for (const auto& [key, value] : members) {
            text += "\"" + key + "\": " + value + ", ";
        }
        return text + "}";
    }
};

}  // namespace vantor::support

#endif
