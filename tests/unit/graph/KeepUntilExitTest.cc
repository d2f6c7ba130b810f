#include "graph/KeepUntilExit.h"

#include <gtest/gtest.h>

#include <cstdlib>

#include "graph/InitBarrier.h"
#include "support/ForkedChild.h"

namespace vantor {

namespace {

// Tells on a descriptor that it is destroyed.
class TellTale : public Node {
public:
    explicit TellTale(int report) : Node("telltale"), descriptor(report) {}
    ~TellTale() override { support::WriteReport(descriptor, "destroyed"); }

    void Run() override {}
    std::string DotAttributes() const override { return ""; }

private:
    int descriptor;
};

// A leak checker that finds a lost node changes the exit status.
TEST(KeepUntilExitTest, KeptNodesAreNeitherDestroyedNorLostWhenTheProcessExits) {
    const support::ChildReport child = support::RunForked([](int report) -> int {
        for (int i = 0; i < 100; ++i) {
            KeepUntilExit(*new TellTale(report));
        }
        std::exit(0);
    });
    EXPECT_EQ(child.text, "");
    EXPECT_EQ(child.status, 0);
}

TEST(KeepUntilExitTest, BarriersAreNotLostWhenTheProcessExits) {
    const support::ChildReport child = support::RunForked([](int) -> int {
        for (int i = 0; i < 100; ++i) {
            InitBarrier::Get("kept." + std::to_string(i));
        }
        std::exit(0);
    });
    EXPECT_EQ(child.status, 0);
}

TEST(KeepUntilExitTest, NodeMayBeKeptMoreThanOnce) {
    const support::ChildReport child = support::RunForked([](int report) -> int {
        const auto* const node = new TellTale(report);
        KeepUntilExit(*node);
        KeepUntilExit(*node);
        std::exit(0);
    });
    EXPECT_EQ(child.text, "");
    EXPECT_EQ(child.status, 0);
}

}  // namespace

}  // namespace vantor
