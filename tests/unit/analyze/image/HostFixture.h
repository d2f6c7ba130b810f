#ifndef VANTOR_ANALYZE_TESTS_HOSTFIXTURE_H
#define VANTOR_ANALYZE_TESTS_HOSTFIXTURE_H

#include <gtest/gtest.h>

#include <boost/filesystem/operations.hpp>
#include <string>
#include <vector>

#include "image/HostImage.h"
#include "model/Finding.h"
#include "support/TempFolder.h"

namespace vantor::support {

// A host that lies in a folder of the test's own.
class HostFixture : public ::testing::Test {
protected:
    void Write(const std::string& path, const std::string& content, mode_t mode = 0644) const {
        const boost::filesystem::path place(folder.Path() + path);
        boost::filesystem::create_directories(place.parent_path());
        WriteFile(place.string(), content, mode);
    }

    // "path:line severity code: text" of each; the ones with the code alone, if there is one.
    std::vector<std::string> Found(const std::string& code = {}) const {
        static const char* const severities[] = {"error", "warning", "note"};
        std::vector<std::string> texts;
        for (const analyze::Finding& finding : findings) {
            if (code.empty() || finding.code == code) {
                texts.push_back(finding.place.path + ":" + std::to_string(finding.place.line) +
                                " " + severities[static_cast<int>(finding.severity)] + " " +
                                finding.code + ": " + finding.text);
            }
        }
        return texts;
    }

    TempFolder folder;
    const analyze::HostImage image{folder.Path()};
    analyze::Findings findings;
};

}  // namespace vantor::support

#endif
