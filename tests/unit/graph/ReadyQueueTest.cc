#include "graph/ReadyQueue.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <algorithm>
#include <list>
#include <memory>
#include <random>
#include <string>
#include <vector>

#include "graph/GlobalLock.h"
#include "graph/GraphFaults.h"
#include "support/GraphText.h"
#include "support/Sanitizers.h"

namespace vantor {

namespace {

using support::RunOrder;
using support::TestNode;
using ::testing::ElementsAre;

// Nodes of chosen heights: each has one of a chain below it, whose heights are 1, 2, 3 and so on.
class NodesOfHeights {
public:
    explicit NodesOfHeights(int greatest) {
        for (int height = 1; height < greatest; ++height) {
            TestNode& node = Make("chain" + std::to_string(height));
            if (height > 1) {
                node.AddDependent(*chain.back());
            }
            chain.push_back(&node);
        }
    }

    TestNode& OfHeight(int height) {
        TestNode& node = Make(std::to_string(height) + "#" + std::to_string(nodes.size()));
        if (height > 1) {
            node.AddDependent(*chain[static_cast<std::size_t>(height) - 2]);
        }
        return node;
    }

private:
    TestNode& Make(const std::string& name) {
        nodes.push_back(std::make_unique<TestNode>(name, order));
        return *nodes.back();
    }

    RunOrder order;
    std::vector<std::unique_ptr<TestNode>> nodes;
    std::vector<TestNode*> chain;
};

// One list in the order in which the nodes became ready, and one pass over it for each choice.
class PlainScan {
public:
    using Position = std::list<Node*>::iterator;

    void Push(Node& node) { queue.push_back(&node); }
    bool Empty() const { return queue.empty(); }
    void Take(Position position) { queue.erase(position); }

    const std::vector<Position>& Highest() {
        std::int32_t best = 0;
        for (auto node = queue.begin(); node != queue.end(); ++node) {
            const std::int32_t height = (*node)->Height();
            if (height > best) {
                candidates.clear();
                best = height;
            }
            if (height == best) {
                candidates.push_back(node);
            }
        }
        return candidates;
    }

private:
    std::list<Node*> queue;
    std::vector<Position> candidates;
};

class ReadyQueueTest : public support::GraphTest {
protected:
    void Push(std::initializer_list<Node*> pushed) {
        for (Node* node : pushed) {
            queue.Push(*node);
        }
    }

    // Takes the highest and oldest, again and again, and expects these.
    void ExpectTaken(std::initializer_list<Node*> taken) {
        for (Node* node : taken) {
            EXPECT_EQ(&queue.TakeHighest(0), node) << node->Name();
        }
    }

    // Pushes and takes nodes of heights from 1 to the greatest, all at random, and expects each
    // choice to be that of a plain scan, with a draw among the highest.
    void CompareWithPlainScan(std::size_t nodeCount, int greatestHeight, int stepCount);

    NodesOfHeights nodes{100};
    ReadyQueue queue;
    const GlobalLockGuard guard;
};

TEST_F(ReadyQueueTest, IsEmptyUntilANodeIsPushedAndAfterTheLastIsTaken) {
    TestNode& node = nodes.OfHeight(1);
    EXPECT_TRUE(queue.Empty());
    queue.Push(node);
    EXPECT_FALSE(queue.Empty());
    EXPECT_EQ(&queue.TakeHighest(0), &node);
    EXPECT_TRUE(queue.Empty());
}

TEST_F(ReadyQueueTest, EqualsLeaveInTheOrderInWhichTheyCame) {
    TestNode& first = nodes.OfHeight(3);
    TestNode& second = nodes.OfHeight(3);
    TestNode& third = nodes.OfHeight(3);
    Push({&first, &second, &third});
    ExpectTaken({&first, &second, &third});
}

TEST_F(ReadyQueueTest, AHigherNodeThatCameLaterLeavesFirst) {
    TestNode& low = nodes.OfHeight(1);
    TestNode& high = nodes.OfHeight(9);
    TestNode& middle = nodes.OfHeight(4);
    Push({&low, &high, &middle});
    ExpectTaken({&high, &middle, &low});
}

TEST_F(ReadyQueueTest, OnlyTheHighestAreCounted) {
    Push({&nodes.OfHeight(2), &nodes.OfHeight(5), &nodes.OfHeight(2), &nodes.OfHeight(5)});
    EXPECT_EQ(queue.HighestCount(), 2U);
}

TEST_F(ReadyQueueTest, OneFromTheMiddleLeavesTheOthersInTheirOrder) {
    TestNode& first = nodes.OfHeight(2);
    TestNode& second = nodes.OfHeight(2);
    TestNode& third = nodes.OfHeight(2);
    Push({&first, &second, &third});
    EXPECT_EQ(&queue.TakeHighest(1), &second);
    ExpectTaken({&first, &third});
}

TEST_F(ReadyQueueTest, WhoComesAfterTheLastWasTakenStandsAtTheEnd) {
    TestNode& first = nodes.OfHeight(2);
    TestNode& last = nodes.OfHeight(2);
    TestNode& later = nodes.OfHeight(2);
    Push({&first, &last});
    EXPECT_EQ(&queue.TakeHighest(1), &last);
    queue.Push(later);
    ExpectTaken({&first, &later});
}

// Its height is computed when it is asked for, and kept from then on.
TEST_F(ReadyQueueTest, HeightOfANodeThatIsAloneIsNotAskedFor) {
    TestNode& alone = nodes.OfHeight(1);
    queue.Push(alone);
    alone.AddDependent(nodes.OfHeight(3));
    EXPECT_EQ(alone.Height(), 4);
}

TEST_F(ReadyQueueTest, HeightOfNodesThatTheSameOnesWaitForIsNotAskedFor) {
    TestNode& first = nodes.OfHeight(2);
    TestNode& second = nodes.OfHeight(2);
    Push({&first, &second});
    EXPECT_EQ(queue.HighestCount(), 2U);
    for (TestNode* const node : {&first, &second}) {
        node->AddDependent(nodes.OfHeight(3));
        EXPECT_EQ(node->Height(), 4);
    }
}

TEST_F(ReadyQueueTest, NodesThatTheSameOnesWaitForAreComparedWithTheNext) {
    TestNode& first = nodes.OfHeight(2);
    TestNode& second = nodes.OfHeight(2);
    TestNode& high = nodes.OfHeight(3);
    Push({&first, &second, &high});
    EXPECT_EQ(queue.HighestCount(), 1U);
    ExpectTaken({&high, &first, &second});
}

// As where a plugin between them was declared done without running: then both ends may be ready.
TEST_F(ReadyQueueTest, NodesStayInTheirOrderWhenTheHeightOfOneAboveThemIsAskedFor) {
    TestNode& first = nodes.OfHeight(2);
    TestNode& second = nodes.OfHeight(2);
    TestNode& third = nodes.OfHeight(2);
    TestNode& above = nodes.OfHeight(1);
    for (TestNode* const node : {&third, &second, &first}) {
        above.AddDependent(*node);
    }
    Push({&first, &second, &third, &above});
    ExpectTaken({&above, &first, &second, &third});
}

// Nobody has asked any of them for its height before.
TEST_F(ReadyQueueTest, NodesOfUnknownHeightLeaveHighestAndOldestFirst) {
    std::mt19937 random(20261123);
    for (int round = 0; round < 2000; ++round) {
        std::vector<std::pair<int, Node*>> ready;
        for (int step = 0; step < 12; ++step) {
            if (ready.empty() || random() % 3 != 0) {
                const int height = 1 + static_cast<int>(random() % 4);
                ready.emplace_back(height, &nodes.OfHeight(height));
                queue.Push(*ready.back().second);
                continue;
            }
            const auto first = std::max_element(
                ready.begin(), ready.end(),
                [](const auto& one, const auto& other) { return one.first < other.first; });
            ASSERT_EQ(&queue.TakeHighest(0), first->second) << "round " << round;
            ready.erase(first);
        }
        while (!queue.Empty()) {
            queue.TakeHighest(0);
        }
    }
}

TEST_F(ReadyQueueTest, NodeThatWasAloneIsComparedWithTheNext) {
    TestNode& low = nodes.OfHeight(2);
    TestNode& high = nodes.OfHeight(3);
    Push({&low, &high});
    EXPECT_EQ(queue.HighestCount(), 1U);
    ExpectTaken({&high, &low});
}

void ReadyQueueTest::CompareWithPlainScan(std::size_t nodeCount, int greatestHeight,
                                          int stepCount) {
    std::mt19937 random(20261122);
    std::vector<Node*> idle;
    for (std::size_t index = 0; index < nodeCount; ++index) {
        const auto heights = static_cast<unsigned>(greatestHeight);
        idle.push_back(&nodes.OfHeight(1 + static_cast<int>(random() % heights)));
    }
    PlainScan model;
    std::size_t choices = 0;
    for (int step = 0; step < stepCount; ++step) {
        const bool push = model.Empty() || (!idle.empty() && random() % 2 == 0);
        if (push) {
            std::swap(idle[random() % idle.size()], idle.back());
            queue.Push(*idle.back());
            model.Push(*idle.back());
            idle.pop_back();
            continue;
        }
        const std::vector<PlainScan::Position>& highest = model.Highest();
        ASSERT_EQ(queue.HighestCount(), highest.size()) << "step " << step;
        const std::size_t position = random() % 2 == 0 ? 0 : random() % highest.size();
        Node& taken = queue.TakeHighest(position);
        ASSERT_EQ(&taken, *highest[position]) << "step " << step;
        model.Take(highest[position]);
        ASSERT_EQ(queue.Empty(), model.Empty()) << "step " << step;
        idle.push_back(&taken);
        ++choices;
    }
    EXPECT_GT(choices, static_cast<std::size_t>(stepCount) * 2 / 5);
}

TEST_F(ReadyQueueTest, AMillionRandomStepsChooseAsAPlainScanDoes) {
    CompareWithPlainScan(24, 5, support::underSanitizers ? 100000 : 1000000);
}

TEST_F(ReadyQueueTest, ManyRowsChooseAsAPlainScanDoes) {
    CompareWithPlainScan(400, 100, support::underSanitizers ? 5000 : 50000);
}

}  // namespace

}  // namespace vantor
