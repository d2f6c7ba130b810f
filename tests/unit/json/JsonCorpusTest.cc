// The inputs that fuzzing begins with, which are worth a look in every build.

#include <gtest/gtest.h>

#include <boost/filesystem/operations.hpp>

#include "fuzz/ReadingComparison.h"
#include "support/TempFolder.h"

namespace vantor {

namespace {

TEST(JsonCorpusTest, EveryInputIsReadByTheRules) {
    int inputs = 0;
    for (const auto& entry : boost::filesystem::recursive_directory_iterator(FUZZ_CORPUS_FOLDER)) {
        if (boost::filesystem::is_regular_file(entry.path())) {
            const std::string text = support::ReadFile(entry.path().string());
            EXPECT_EQ(support::CompareReadings(text), "") << entry.path();
            ++inputs;
        }
    }
    EXPECT_GT(inputs, 0);
}

}  // namespace

}  // namespace vantor
