#include "driver/RunOnceRecord.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <sys/stat.h>
#include <syslog.h>
#include <unistd.h>
#include <zlib.h>

#include <vector>

#include "support/PrivateRoot.h"
#include "support/SyslogCapture.h"

namespace vantor {
namespace {

using support::LogEntry;
using ::testing::ElementsAre;
using ::testing::IsEmpty;

constexpr const char* record = "/bootbank/vantorbk.gz";

// The content of a gzip file of a single member and nothing behind it; zlib checks its sums.
std::string Inflate(const std::string& compressed) {
    z_stream stream{};
    EXPECT_EQ(inflateInit2(&stream, 15 + 16), Z_OK);
    std::vector<char> content(1U << 20U);
    stream.next_in = reinterpret_cast<Bytef*>(const_cast<char*>(compressed.data()));
    stream.avail_in = static_cast<uInt>(compressed.size());
    stream.next_out = reinterpret_cast<Bytef*>(content.data());
    stream.avail_out = static_cast<uInt>(content.size());
    EXPECT_EQ(inflate(&stream, Z_FINISH), Z_STREAM_END);
    EXPECT_EQ(stream.avail_in, 0U);
    const std::string text(content.data(), stream.total_out);
    inflateEnd(&stream);
    return text;
}

int Byte(const std::string& text, std::size_t index) {
    return static_cast<unsigned char>(text.at(index));
}

TEST(CompressRunOnceRecordTest, AnEmptySetIsTheBareLine) {
    EXPECT_EQ(Inflate(CompressRunOnceRecord({})), "vantor.run-once=\n");
}

TEST(CompressRunOnceRecordTest, EveryKeyIsFollowedByACommaInSortedOrder) {
    EXPECT_EQ(Inflate(CompressRunOnceRecord({"b", "a"})), "vantor.run-once=a,b,\n");
}

TEST(CompressRunOnceRecordTest, KeysAreWrittenAsTheyAre) {
    EXPECT_EQ(Inflate(CompressRunOnceRecord({"", "a b", "x,y", "\n"})),
              "vantor.run-once=,\n,a b,x,y,\n");
}

TEST(CompressRunOnceRecordTest, AnyNumberOfKeysFits) {
    std::set<std::string> keys;
    std::string line = "vantor.run-once=";
    for (int i = 10000; i < 30000; ++i) {
        keys.insert("plugin" + std::to_string(i));
        line += "plugin" + std::to_string(i) + ",";
    }
    EXPECT_EQ(Inflate(CompressRunOnceRecord(keys)), line + "\n");
}

TEST(CompressRunOnceRecordTest, TheHeaderHasNoNameNoCommentAndNoTime) {
    const std::string bytes = CompressRunOnceRecord({"a"});
    EXPECT_EQ(Byte(bytes, 0), 0x1f);  // magic number
    EXPECT_EQ(Byte(bytes, 1), 0x8b);
    EXPECT_EQ(Byte(bytes, 2), 8);  // the deflate method
    EXPECT_EQ(Byte(bytes, 3), 0);  // flags: no name, no comment, no extra field, no header sum
    EXPECT_EQ(bytes.substr(4, 4), std::string(4, '\0'));  // modification time
    EXPECT_EQ(Byte(bytes, 8), 0);                         // neither the best nor the fastest level
}

TEST(CompressRunOnceRecordTest, TheSameKeysGiveTheSameBytes) {
    EXPECT_EQ(CompressRunOnceRecord({"a", "b"}), CompressRunOnceRecord({"b", "a"}));
}

// What zlib makes of the line with the parameters that the record is promised to have. The line is
// long enough that each of them shows.
TEST(CompressRunOnceRecordTest, TheContentIsDeflatedWithTheDefaultParameters) {
    std::set<std::string> keys;
    for (unsigned i = 0; i < 20000; ++i) {
        keys.insert("plugin" + std::to_string(i * 2654435761U));
    }
    std::string line = "vantor.run-once=";
    for (const std::string& key : keys) {
        line += key + ",";
    }
    line += "\n";
    z_stream stream{};
    ASSERT_EQ(deflateInit2(&stream, Z_DEFAULT_COMPRESSION, Z_DEFLATED, -15, 8, Z_DEFAULT_STRATEGY),
              Z_OK);
    std::vector<char> deflated(line.size());
    stream.next_in = reinterpret_cast<Bytef*>(line.data());
    stream.avail_in = static_cast<uInt>(line.size());
    stream.next_out = reinterpret_cast<Bytef*>(deflated.data());
    stream.avail_out = static_cast<uInt>(deflated.size());
    EXPECT_EQ(deflate(&stream, Z_FINISH), Z_STREAM_END);
    const std::string expected(deflated.data(), stream.total_out);
    deflateEnd(&stream);
    const std::string bytes = CompressRunOnceRecord(keys);
    // A header of 10 bytes before, two sums of 4 bytes behind.
    EXPECT_EQ(bytes.substr(10, bytes.size() - 18), expected);
}

class WriteRunOnceRecordTest : public ::testing::Test {
protected:
    support::PrivateRoot root;
    support::SyslogCapture log;
};

TEST_F(WriteRunOnceRecordTest, TheFileHoldsTheCompressedLine) {
    root.MakeFolder("/bootbank");
    WriteRunOnceRecord({"b", "a"});
    EXPECT_EQ(Inflate(root.Read(record)), "vantor.run-once=a,b,\n");
    EXPECT_THAT(log.Entries(), IsEmpty());
}

TEST_F(WriteRunOnceRecordTest, ALongerFileIsReplacedWhole) {
    root.Write(record, std::string(5000, 'x'));
    WriteRunOnceRecord({});
    EXPECT_EQ(root.Read(record), CompressRunOnceRecord({}));
}

TEST_F(WriteRunOnceRecordTest, ARecordThatCannotBeOpenedIsLogged) {
    WriteRunOnceRecord({"a"});
    EXPECT_THAT(
        log.Entries(),
        ElementsAre(LogEntry{LOG_ERR, "unable to write run-once record (/bootbank/vantorbk.gz): "
                                      "No such file or directory"}));
}

TEST_F(WriteRunOnceRecordTest, ARecordThatIsAFolderIsLogged) {
    root.MakeFolder(record);
    WriteRunOnceRecord({"a"});
    EXPECT_THAT(log.Entries(),
                ElementsAre(LogEntry{LOG_ERR, "unable to write run-once record "
                                              "(/bootbank/vantorbk.gz): Is a directory"}));
}

TEST_F(WriteRunOnceRecordTest, AFullDiskIsLogged) {
    root.MakeFolder("/bootbank");
    ASSERT_EQ(symlink("/dev/full", root.Path(record).c_str()), 0);
    WriteRunOnceRecord({"a"});
    EXPECT_THAT(
        log.Entries(),
        ElementsAre(LogEntry{LOG_ERR, "unable to write run-once record (/bootbank/vantorbk.gz): "
                                      "No space left on device"}));
}

}  // namespace
}  // namespace vantor
