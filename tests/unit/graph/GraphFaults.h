#ifndef VANTOR_GRAPH_TESTS_GRAPHFAULTS_H
#define VANTOR_GRAPH_TESTS_GRAPHFAULTS_H

#include <gtest/gtest.h>
#include <pthread.h>

#include <atomic>
#include <deque>
#include <vector>

#include "support/FaultPoint.h"

namespace vantor::support {

// The calls of the C library that the tests of graph/ watch or make fail. They see the calls of our
// own objects; std::thread and its kin, which the C++ library implements, go past them.
struct GraphFaults {
    FaultPoint condInit;
    FaultPoint threadCreate;
    FaultPoint threadJoin;
    FaultPoint condWait;
    FaultPoint condBroadcast;
    FaultPoint yield;
    FaultPoint rand;
    FaultPoint srand;

    // What rand() answers next; the C library's own draw when it is empty.
    std::deque<int> draws;
    // The threads in the order in which they were created and joined.
    std::vector<pthread_t> created;
    std::vector<pthread_t> joined;

    // What pthread_self() answers; 0: the truth.
    std::atomic<pthread_t> self{0};

    void Reset();
};

GraphFaults& Faults();

// Every test starts and ends without a planned fault.
class GraphTest : public ::testing::Test {
protected:
    GraphTest() { Faults().Reset(); }
    ~GraphTest() override { Faults().Reset(); }
};

}  // namespace vantor::support

#endif
