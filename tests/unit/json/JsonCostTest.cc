// That reading takes steps and memory in proportion to the input: operations of the buffer and
// bytes asked of the heap are counted, no time is measured.

#include <gtest/gtest.h>

#include <istream>
#include <sstream>

#include "json/AllocationMeter.h"
#include "json/JsonReader.h"
#include "json/JsonText.h"
#include "json/TestBuffers.h"
#include "support/Sanitizers.h"

namespace vantor {

namespace {

using support::AllocationMeter;
using support::CountingBuffer;
using support::StateOf;

// A step too many for each byte before it shows at either size.
constexpr std::size_t large = support::underSanitizers ? 3'000'000 : 10'000'000;

std::string RepeatedUpTo(const std::string& text, std::size_t size) {
    std::string repeated;
    repeated.reserve(size + text.size());
    while (repeated.size() < size) {
        repeated += text;
    }
    return repeated;
}

struct Cost {
    std::string state;
    JsonValue value;
    double operationsPerByte = 0;
    double heapPerByte = 0;
};

Cost CostOf(const std::string& text) {
    CountingBuffer buffer(text);
    std::istream stream(&buffer);
    Cost cost;
    const AllocationMeter meter;
    ReadValue(stream, cost.value);
    const auto size = static_cast<double>(text.size());
    cost.heapPerByte = static_cast<double>(meter.Bytes()) / size;
    cost.operationsPerByte = static_cast<double>(buffer.Operations()) / size;
    cost.state = StateOf(stream);
    return cost;
}

// Looking at a byte before it is consumed, and now and then once more.
constexpr double fewOperations = 4.0;
// A buffer that doubles as it grows takes less than four times its last size.
constexpr double growth = 4.0;

TEST(JsonCostTest, OneLargeString) {
    const Cost cost = CostOf("\"" + std::string(large, 'x') + "\"");
    EXPECT_EQ(cost.state, "read");
    EXPECT_EQ(cost.value.text.size(), large);
    EXPECT_LE(cost.operationsPerByte, fewOperations);
    EXPECT_LE(cost.heapPerByte, growth);
}

TEST(JsonCostTest, OneLargeStringOfEscapes) {
    const Cost cost = CostOf("\"" + RepeatedUpTo("\\q\\n\\u0041", large) + "\"");
    EXPECT_EQ(cost.state, "read");
    EXPECT_LE(cost.operationsPerByte, fewOperations);
    EXPECT_LE(cost.heapPerByte, growth);
}

TEST(JsonCostTest, LargeDocumentOfRecords) {
    const std::string record =
        "{\"name\": \"" + std::string(200, 'n') + "\", \"values\": [1, -2.5e3, true, null]}, ";
    const Cost cost = CostOf("[" + RepeatedUpTo(record, large) + "]");
    EXPECT_EQ(cost.state, "read");
    EXPECT_EQ(cost.value.elements.size(), (large + record.size() - 1) / record.size());
    EXPECT_LE(cost.operationsPerByte, fewOperations);
    // A value takes some hundred bytes, however short it is written, and a list of them grows.
    EXPECT_LE(cost.heapPerByte, 32.0);
}

TEST(JsonCostTest, LargeObjectOfDifferentKeys) {
    std::string text = "{";
    for (int key = 0; text.size() < large; ++key) {
        text += "\"" + std::to_string(key) + std::string(200, 'k') + "\": \"" +
                std::string(200, 'v') + "\",";
    }
    const Cost cost = CostOf(text + "}");
    EXPECT_EQ(cost.state, "read");
    EXPECT_LE(cost.operationsPerByte, fewOperations);
    EXPECT_LE(cost.heapPerByte, 8.0);
}

TEST(JsonCostTest, LargeKeyThatIsRepeated) {
    const std::string member = "\"" + std::string(large / 4, 'k') + "\": 1,";
    const Cost cost = CostOf("{" + RepeatedUpTo(member, large) + "}");
    EXPECT_EQ(cost.state, "read");
    EXPECT_EQ(cost.value.members.size(), 1U);
    EXPECT_LE(cost.operationsPerByte, fewOperations);
    EXPECT_LE(cost.heapPerByte, growth + 1.0);
}

// A value that was copied on its way out of every level would cost a thousand times its size.
TEST(JsonCostTest, LargeStringUnderManyLevels) {
    std::string text;
    std::string closing;
    for (int level = 0; level < 500; ++level) {
        text += "[{\"k\":";
        closing += "}]";
    }
    text += "\"" + std::string(large, 'x') + "\"";
    const Cost cost = CostOf(text + closing);
    EXPECT_EQ(cost.state, "read");
    EXPECT_LE(cost.operationsPerByte, fewOperations);
    EXPECT_LE(cost.heapPerByte, growth);
}

TEST(JsonCostTest, LargeNumber) {
    const Cost cost = CostOf("0." + std::string(large, '3') + "]");
    EXPECT_EQ(cost.state, "read");
    EXPECT_DOUBLE_EQ(cost.value.number, 1.0 / 3.0);
    EXPECT_LE(cost.operationsPerByte, fewOperations);
    EXPECT_LE(cost.heapPerByte, growth);
}

TEST(JsonCostTest, ManyBlanksAndComments) {
    for (const std::string blank : {" ", "\n\t", "/**/", "/* * */ ", "//\n", "// comment\n\n"}) {
        const Cost cost = CostOf(RepeatedUpTo(blank, large / 4) + "1 ");
        EXPECT_EQ(cost.state, "read") << blank;
        EXPECT_LE(cost.operationsPerByte, fewOperations) << blank;
        EXPECT_LE(cost.heapPerByte, 0.01) << blank;
    }
}

TEST(JsonCostTest, OneLargeComment) {
    for (const std::string& comment :
         {"/*" + std::string(large, '*') + "*/", "//" + std::string(large, '/') + "\n"}) {
        const Cost cost = CostOf(comment + "1 ");
        EXPECT_EQ(cost.state, "read");
        EXPECT_LE(cost.operationsPerByte, fewOperations);
        EXPECT_LE(cost.heapPerByte, 0.01);
    }
}

// In a buffer that holds the whole text ready no operation is counted: a reader that went to the
// end of it over and over would not be done within the time that a test has.
TEST(JsonCostTest, WholeTextReadyInTheBuffer) {
    for (const std::string item : {"\\q\\n", "\\\"x", "x"}) {
        std::istringstream stream("[\"" + RepeatedUpTo(item, large) + "\"]");
        JsonValue value;
        ReadValue(stream, value);
        EXPECT_EQ(StateOf(stream), "read") << item;
    }
    for (const std::string item : {"1,", "-1.5e3 ,", "\"\",", "[],", "true,", " /**/ null,"}) {
        std::istringstream stream("[" + RepeatedUpTo(item, large / 10) + "]");
        JsonValue value;
        ReadValue(stream, value);
        EXPECT_EQ(StateOf(stream), "read") << item;
    }
}

// Arrays in an array have no room to spare, but for one that nothing stands before.
TEST(JsonCostTest, ManySmallArrays) {
    constexpr std::size_t arrays = 10'000;
    std::string text = "[";
    for (std::size_t array = 0; array < arrays; ++array) {
        text += "[1,2,3,4,5],";
    }
    std::istringstream stream(text + "]");
    JsonValue value;
    const AllocationMeter meter;
    ReadValue(stream, value);
    EXPECT_EQ(StateOf(stream), "read");
    // The arrays' own elements, and the list of the arrays as it grows.
    EXPECT_LE(meter.Bytes(), (5 + 4) * arrays * sizeof value);
    ASSERT_EQ(value.elements.size(), arrays);
    for (std::size_t array = 1; array < arrays; ++array) {
        ASSERT_EQ(value.elements[array].elements.capacity(), 5U) << array;
    }
}

TEST(JsonCostTest, OpeningBracketsWithoutEndAreGivenUpAtTheDepthLimit) {
    const std::string text(large, '[');
    CountingBuffer buffer(text);
    std::istream stream(&buffer);
    JsonValue value;
    ReadValue(stream, value);
    EXPECT_EQ(StateOf(stream), "failed");
    EXPECT_LE(buffer.Operations(), 10'000U);
}

TEST(JsonCostTest, GarbageIsGivenUpAtOnce) {
    CountingBuffer buffer("[" + std::string(large, 'x'));
    std::istream stream(&buffer);
    JsonValue value;
    ReadValue(stream, value);
    EXPECT_EQ(StateOf(stream), "failed");
    EXPECT_LE(buffer.Operations(), 20U);
}

}  // namespace

}  // namespace vantor
