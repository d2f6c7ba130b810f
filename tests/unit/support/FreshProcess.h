#ifndef VANTOR_SUPPORT_FRESHPROCESS_H
#define VANTOR_SUPPORT_FRESHPROCESS_H

#include <gtest/gtest.h>

#include <cstdio>
#include <functional>

#include "support/ForkedChild.h"

namespace vantor::support {

// Runs `body` in a child process, for code that remembers something for the life of its process.
// Failures and exceptions of the body are those of the calling test.
inline void InFreshProcess(const std::function<void()>& body) {
    std::fflush(stdout);
    const ChildReport report = RunForked([&body](int) {
        body();
        std::fflush(stdout);
        return ::testing::Test::HasFailure() ? 1 : 0;
    });
    EXPECT_EQ(report.status, 0) << "the child failed: " << report.text;
}

}  // namespace vantor::support

#endif
