#ifndef VANTOR_JSON_TESTS_JSONPLUGINFIXTURE_H
#define VANTOR_JSON_TESTS_JSONPLUGINFIXTURE_H

#include <gtest/gtest.h>

#include <memory>
#include <string>

#include "json/DocumentText.h"
#include "json/JSONPlugin.h"
#include "plugins/Exceptions.h"
#include "support/ErrorText.h"
#include "support/TempFolder.h"

namespace vantor::support {

// A folder of its own with one document in it, of the plugin "netcfg".
class JSONPluginFixture : public ::testing::Test {
protected:
    std::unique_ptr<JSONPlugin> Load(const std::string& text) const {
        WriteFile(path, text);
        return Open(path);
    }
    std::unique_ptr<JSONPlugin> Load(const DocumentText& document) const {
        return Load(document.Text());
    }

    // The plugin that is made of the file that is there.
    static std::unique_ptr<JSONPlugin> Open(const std::string& file) {
        return std::make_unique<JSONPlugin>("netcfg", file);
    }

    // The whole text of the rejection; a remark for a document that is accepted.
    std::string RejectionOf(const std::string& text) const {
        WriteFile(path, text);
        return RejectionOfFile(path);
    }
    std::string RejectionOf(const DocumentText& document) const {
        return RejectionOf(document.Text());
    }
    static std::string RejectionOfFile(const std::string& file) {
        return ErrorText<InvalidPluginException>([&file] { Open(file); });
    }

    // What the whole text is to be.
    static std::string Invalid(const std::string& file, const std::string& reason) {
        return "plugin `" + file + "' is invalid: " + reason;
    }
    std::string Invalid(const std::string& reason) const { return Invalid(path, reason); }

    const TempFolder folder;
    const std::string path = folder.File("netcfg.json");
};

}  // namespace vantor::support

#endif
