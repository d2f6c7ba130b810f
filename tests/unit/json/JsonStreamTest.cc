// Streams that are not what a reader hopes for: spent, throwing, out of memory, read in pieces.

#include <gtest/gtest.h>

#include <cstdio>
#include <fstream>
#include <functional>
#include <sstream>
#include <stdexcept>
#include <utility>

#include "json/AllocationMeter.h"
#include "json/JsonReader.h"
#include "json/JsonText.h"
#include "json/TestBuffers.h"
#include "support/TempFolder.h"

namespace vantor {

namespace {

using support::CountingBuffer;
using support::FailingAllocation;
using support::RestOf;
using support::Show;
using support::StateOf;
using support::TempFolder;
using support::WriteFile;

const char* const document =
    "/* c */ {\"key\": [true, false, null, -12.5e3, \"text\\n\", {}], // d\n \"b\": {\"c\":[]} }";

// The same as it is shown, and a member whose string has room outside the string object itself.
const char* const shownDocument =
    "{\"b\": {\"c\": []}, \"key\": [true, false, null, -12500, \"text\\x0a\", {}]}";

struct NamedOperation {
    const char* name;
    std::function<void(std::istream&)> read;
};

// Every reading operation, its output thrown away.
std::vector<NamedOperation> AllOperations() {
    return {
        {"value",
         [](std::istream& stream) {
             JsonValue out;
             ReadValue(stream, out);
         }},
        {"object",
         [](std::istream& stream) {
             JsonValue out;
             ReadObject(stream, out.members);
         }},
        {"array",
         [](std::istream& stream) {
             JsonValue out;
             ReadArray(stream, out.elements);
         }},
        {"string",
         [](std::istream& stream) {
             JsonValue out;
             ReadString(stream, out.text);
         }},
        {"number",
         [](std::istream& stream) {
             JsonValue out;
             ReadNumber(stream, out.number);
         }},
        {"bool",
         [](std::istream& stream) {
             JsonValue out;
             ReadBool(stream, out.flag);
         }},
        {"null", [](std::istream& stream) { ReadNull(stream); }},
        {"blanks", [](std::istream& stream) { SkipBlanks(stream); }},
    };
}

TEST(JsonStreamTest, FailedStreamStaysFailedAndUnread) {
    for (const auto& [name, read] : AllOperations()) {
        std::istringstream stream(" []");
        stream.setstate(std::ios_base::failbit);
        read(stream);
        EXPECT_EQ(StateOf(stream), "failed") << name;
        EXPECT_EQ(RestOf(*stream.rdbuf()), " []") << name;
    }
}

TEST(JsonStreamTest, BadStreamStaysBadAndUnread) {
    for (const auto& [name, read] : AllOperations()) {
        std::istringstream stream(" []");
        stream.setstate(std::ios_base::badbit);
        read(stream);
        EXPECT_EQ(StateOf(stream), "bad") << name;
        EXPECT_EQ(RestOf(*stream.rdbuf()), " []") << name;
    }
}

TEST(JsonStreamTest, StreamWithoutABufferIsBad) {
    for (const auto& [name, read] : AllOperations()) {
        std::istream stream(nullptr);
        read(stream);
        EXPECT_EQ(StateOf(stream), "bad") << name;
    }
}

TEST(JsonStreamTest, StreamThatHasMetItsEndFails) {
    for (const auto& [name, read] : AllOperations()) {
        std::istringstream stream("");
        stream.setstate(std::ios_base::eofbit);
        read(stream);
        EXPECT_EQ(StateOf(stream), "failed") << name;
    }
}

TEST(JsonStreamTest, FailedStreamLeavesTheValueAlone) {
    std::istringstream stream("[]");
    stream.setstate(std::ios_base::failbit);
    JsonValue value;
    value.text = "old";
    ReadValue(stream, value);
    EXPECT_EQ(value.kind, JsonKind::None);
    EXPECT_EQ(value.text, "old");
}

TEST(JsonStreamTest, EndIsNotedOnlyWhenItIsMet) {
    std::istringstream closed("[1]");
    JsonValue value;
    ReadValue(closed, value);
    EXPECT_FALSE(closed.eof());

    std::istringstream open("[1");
    ReadValue(open, value);
    EXPECT_TRUE(open.eof());
}

TEST(JsonStreamTest, BufferThatThrowsAtAnyOperationMakesTheStreamBad) {
    CountingBuffer whole(document);
    std::istream wholeStream(&whole);
    JsonValue read;
    ReadValue(wholeStream, read);
    ASSERT_EQ(Show(read), shownDocument);

    for (std::uint64_t limit = 0; limit < whole.Operations(); ++limit) {
        CountingBuffer buffer(document, limit);
        std::istream stream(&buffer);
        JsonValue value;
        EXPECT_NO_THROW(ReadValue(stream, value)) << limit;
        EXPECT_EQ(StateOf(stream), "bad") << limit;
        EXPECT_EQ(value.kind, JsonKind::None) << limit;
    }
}

TEST(JsonStreamTest, EveryOperationTurnsAThrowingBufferIntoABadStream) {
    for (const auto& [name, read] : AllOperations()) {
        CountingBuffer buffer("", 0);
        std::istream stream(&buffer);
        EXPECT_NO_THROW(read(stream)) << name;
        EXPECT_EQ(StateOf(stream), "bad") << name;
    }
}

TEST(JsonStreamTest, ThrowingBufferLeavesTheOutputsOfAllButTheObject) {
    const auto throwingAt = [](const std::string& text, std::uint64_t limit, auto read) {
        CountingBuffer buffer(text, limit);
        std::istream stream(&buffer);
        read(stream);
        EXPECT_EQ(StateOf(stream), "bad") << text;
    };
    std::string text = "old";
    throwingAt("\"abc\"", 3, [&text](std::istream& stream) { ReadString(stream, text); });
    EXPECT_EQ(text, "old");
    std::vector<JsonValue> elements(1);
    throwingAt("[1,2,3]", 7, [&elements](std::istream& stream) { ReadArray(stream, elements); });
    EXPECT_EQ(Show(elements), "[none]");
    bool flag = true;
    throwingAt("false", 3, [&flag](std::istream& stream) { ReadBool(stream, flag); });
    EXPECT_TRUE(flag);
}

// As after any other failure.
TEST(JsonStreamTest, ThrowingBufferReplacesTheMembersByWhatWasRead) {
    const std::string text = "{\"a\":1,\"b\":\"xxxxxxxxxxxxxxxxxxxx\"}";
    CountingBuffer buffer(text, text.size());
    std::istream stream(&buffer);
    std::map<std::string, JsonValue> members{{"old", {}}};
    ReadObject(stream, members);
    EXPECT_EQ(StateOf(stream), "bad");
    EXPECT_EQ(members.count("old"), 0U);
    EXPECT_EQ(members.count("a"), 1U);
}

TEST(JsonStreamTest, BufferThatCannotPutBackMakesTheStreamBadAfterTrue) {
    class OneWayBuffer : public CountingBuffer {
    public:
        using CountingBuffer::CountingBuffer;

    protected:
        int_type pbackfail(int_type /*byte*/) override { return traits_type::eof(); }
    };
    OneWayBuffer buffer("true,");
    std::istream stream(&buffer);
    JsonValue value;
    ReadValue(stream, value);
    EXPECT_EQ(StateOf(stream), "bad");
    EXPECT_EQ(value.kind, JsonKind::None);
}

TEST(JsonStreamTest, AllocationThatFailsMakesTheStreamBad) {
    std::string text = "{\"a key longer than a string object\": [";
    for (int i = 0; i < 9; ++i) {
        text += "{\"k\": \"a text longer than a string object\"}, 1.5, [[]],";
    }
    text += "]}";
    bool failed = true;
    for (std::uint64_t which = 1; failed; ++which) {
        ASSERT_LT(which, 10000U);
        std::istringstream stream(text);
        JsonValue value;
        {
            const FailingAllocation failing(which);
            ReadValue(stream, value);
            failed = failing.HasFailed();
        }
        EXPECT_EQ(StateOf(stream), failed ? "bad" : "read") << "allocation " << which;
        EXPECT_EQ(value.kind, failed ? JsonKind::None : JsonKind::Object) << which;
    }
}

// A caller that has asked its stream to throw gets the stream's own exception, and no other.
TEST(JsonStreamTest, StreamThatIsToThrowOnFailureThrowsItsOwnException) {
    for (const std::string text : {"", "[1", "nul]", "-"}) {
        std::istringstream stream(text);
        stream.exceptions(std::ios_base::failbit);
        JsonValue value;
        EXPECT_THROW(ReadValue(stream, value), std::ios_base::failure) << text;
    }
}

constexpr std::size_t fileBuffer = BUFSIZ;  // a stream's buffer holds so many bytes, or one less

// A document that begins at every distance from the end of the stream's buffer.
class JsonFileTest : public ::testing::Test {
protected:
    // A buffer size of 0 is the library's own choice.
    void ExpectRead(std::size_t bufferSize) {
        std::ifstream stream;
        std::string area(bufferSize, '\0');
        if (bufferSize > 0) {
            stream.rdbuf()->pubsetbuf(area.data(), static_cast<std::streamsize>(bufferSize));
        }
        stream.open(path, std::ios_base::in | std::ios_base::binary);
        JsonValue value;
        ReadValue(stream, value);
        EXPECT_EQ(StateOf(stream), "read");
        EXPECT_EQ(Show(value), shownDocument);
        EXPECT_EQ(RestOf(*stream.rdbuf()), "behind");
    }

    TempFolder folder;
    const std::string path = folder.File("document.json");
};

TEST_F(JsonFileTest, DocumentMayLieAnywhereInTheBuffersOfAFile) {
    const std::string text = document;
    for (const std::size_t size : {fileBuffer - 1, fileBuffer}) {
        for (std::size_t before = 0; before <= text.size(); ++before) {
            WriteFile(path, std::string(size - before, ' ') + text + "behind");
            SCOPED_TRACE(before);
            ExpectRead(0);
        }
    }
}

// The library's file buffer loses its place when a byte is put back after a read of more than it
// holds, so each of these has room for a literal.
TEST_F(JsonFileTest, FileMayBeReadThroughSmallBuffers) {
    WriteFile(path, std::string(document) + "behind");
    for (const std::size_t size : {6U, 7U, 8U, 9U, 64U}) {
        SCOPED_TRACE(size);
        ExpectRead(size);
    }
}

TEST_F(JsonFileTest, StringMayBeLargerThanTheBufferOfAFile) {
    const std::string largeText(100 * fileBuffer + 1, 'x');
    WriteFile(path, "[\"" + largeText + "\", 1]");
    std::ifstream stream(path, std::ios_base::in | std::ios_base::binary);
    JsonValue value;
    ReadValue(stream, value);
    ASSERT_EQ(value.elements.size(), 2U);
    EXPECT_EQ(value.elements[0].text, largeText);
    EXPECT_EQ(Show(value.elements[1]), "1");
}

TEST_F(JsonFileTest, FileThatCannotBeReadMakesTheStreamBad) {
    std::ifstream stream(folder.Path());  // a folder can be opened, not read
    ASSERT_TRUE(stream.is_open());
    JsonValue value;
    ReadValue(stream, value);
    EXPECT_EQ(StateOf(stream), "bad");
    EXPECT_EQ(value.kind, JsonKind::None);
}

}  // namespace

}  // namespace vantor
