// The metadata record and the entry table as a plugin of each version has them: no shorter record
// is read beyond its end. Each lies against the end of readable memory, so that a read beyond dies.

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <sys/mman.h>
#include <unistd.h>

#include <cstddef>
#include <cstring>
#include <stdexcept>

#include "plugins/Exceptions.h"
#include "plugins/NativePlugin.h"
#include "plugins/TestObjects.h"
#include "support/ErrorText.h"

namespace vantor {
namespace {

using support::NamesOf;
using support::ObjectPath;
using ::testing::ElementsAre;
using ::testing::IsEmpty;

// Two pages of memory, of which the second cannot be touched.
class LastPage {
public:
    LastPage()
        : pageSize(static_cast<std::size_t>(sysconf(_SC_PAGESIZE))),
          memory(mmap(nullptr, 2 * pageSize, PROT_READ | PROT_WRITE, MAP_PRIVATE | MAP_ANONYMOUS,
                      -1, 0)) {
        if (memory == MAP_FAILED || mprotect(End(), pageSize, PROT_NONE) != 0) {
            throw std::runtime_error("no memory");
        }
    }
    ~LastPage() { munmap(memory, 2 * pageSize); }
    LastPage(const LastPage&) = delete;
    LastPage& operator=(const LastPage&) = delete;

    // A copy of the first `size` bytes of `object`, the last of which is the last readable byte.
    const void* Place(const void* object, std::size_t size) const {
        return std::memcpy(End() - size, object, size);
    }

private:
    char* End() const { return static_cast<char*>(memory) + pageSize; }

    std::size_t pageSize;
    void* memory;
};

const char* const needs[] = {"record-need", nullptr};
const char* const gives[] = {"record-give", nullptr};
const char* const flags[] = {"flag", nullptr};

class NativeRecordTest : public ::testing::Test {
protected:
    // A plugin with this record, of which only `size` bytes are there.
    NativePlugin PluginWith(const vantor_metadata_3& record, std::size_t size) {
        substitutes.Set("metadata", page.Place(&record, size));
        return NativePlugin("record", ObjectPath("first"));
    }

    LastPage page;
    support::SymbolSubstitutes substitutes;
    const vantor_metadata_3 wholeRecord = {1, needs, gives, "7.8", 1, flags, flags};
};

class ShortRecordTest : public NativeRecordTest, public ::testing::WithParamInterface<int> {};

TEST_P(ShortRecordTest, IsNotReadBeyondProvides) {
    vantor_metadata_3 record = wholeRecord;
    record.version = GetParam();
    const NativePlugin plugin = PluginWith(record, sizeof(vantor_metadata_1));
    EXPECT_EQ(plugin.ApiVersion(), GetParam());
    EXPECT_THAT(NamesOf(plugin.Dependencies()), ElementsAre("record-need"));
    EXPECT_THAT(NamesOf(plugin.Dependents()), ElementsAre("record-give"));
    EXPECT_FALSE(plugin.RunOnce());
    EXPECT_EQ(plugin.PluginVersion(), "");
    EXPECT_THAT(plugin.RequiredFlags(), IsEmpty());
    EXPECT_THAT(plugin.DisablingFlags(), IsEmpty());
}

INSTANTIATE_TEST_SUITE_P(Versions, ShortRecordTest, ::testing::Values(1, 2));

class LongRecordTest : public NativeRecordTest, public ::testing::WithParamInterface<int> {};

TEST_P(LongRecordTest, IsReadToItsEndAndNoFurther) {
    vantor_metadata_3 record = wholeRecord;
    record.version = GetParam();
    const NativePlugin plugin = PluginWith(record, sizeof(vantor_metadata_3));
    EXPECT_EQ(plugin.ApiVersion(), GetParam());
    EXPECT_TRUE(plugin.RunOnce());
    EXPECT_EQ(plugin.PluginVersion(), "7.8");
    EXPECT_THAT(plugin.RequiredFlags(), ElementsAre("flag"));
    EXPECT_THAT(plugin.DisablingFlags(), ElementsAre("flag"));
}

INSTANTIATE_TEST_SUITE_P(Versions, LongRecordTest, ::testing::Values(3, 4));

class UnsupportedRecordTest : public NativeRecordTest, public ::testing::WithParamInterface<int> {};

TEST_P(UnsupportedRecordTest, IsNotReadBeyondItsVersion) {
    // The version and what aligns the field behind it: a record does not begin between words.
    constexpr std::size_t size = sizeof(void*);
    vantor_metadata_3 record = wholeRecord;
    record.version = GetParam();
    EXPECT_EQ(support::ErrorText<InvalidPluginException>([&] { PluginWith(record, size); }),
              "plugin `" + ObjectPath("first") + "' is invalid: Unsupported API version");
}

INSTANTIATE_TEST_SUITE_P(Versions, UnsupportedRecordTest,
                         ::testing::Values(-2147483647 - 1, -1, 0, 5, 2147483647));

class RunOnceByteTest : public NativeRecordTest, public ::testing::WithParamInterface<int> {};

TEST_P(RunOnceByteTest, AnythingButZeroMeansRunOnce) {
    vantor_metadata_3 record = wholeRecord;
    record.version = 3;
    record.run_once = static_cast<std::uint8_t>(GetParam());
    EXPECT_EQ(PluginWith(record, sizeof record).RunOnce(), GetParam() != 0);
}

INSTANTIATE_TEST_SUITE_P(Bytes, RunOnceByteTest, ::testing::Values(0, 1, 2, 128, 255));

std::uint32_t Succeed() { return 0; }

TEST_F(NativeRecordTest, TheTableOfAVersion1PluginIsNotReadBeyondStart) {
    const vantor_operations table = {&Succeed, &Succeed};
    const LastPage tablePage;
    substitutes.Set("operations",
                    tablePage.Place(&table, offsetof(vantor_operations, apply_host_profile)));
    NativePlugin plugin = PluginWith(wholeRecord, sizeof(vantor_metadata_1));
    EXPECT_FALSE(plugin.SupportsHostProfile());
    plugin.Start();
    EXPECT_EQ(support::ErrorText<NotImplementedException>([&] { plugin.ApplyHostProfile(); }),
              "method `NativePlugin::ApplyHostProfile' is not implemented");
}

TEST_F(NativeRecordTest, AnObjectAtAddressZeroIsNoObject) {
    substitutes.Set("operations", nullptr);
    EXPECT_EQ(support::ErrorText<InvalidPluginException>(
                  [] { NativePlugin("record", ObjectPath("first")); }),
              "plugin `" + ObjectPath("first") + "' is invalid: symbol operations has no address");
}

TEST(NativeLayoutTest, RecordsAndTableAreLaidOutAsPluginsHaveThem) {
    const std::size_t word = sizeof(void*);
    EXPECT_EQ(offsetof(vantor_metadata_1, provides), 2 * word);
    EXPECT_EQ(sizeof(vantor_metadata_1), 3 * word);
    EXPECT_EQ(offsetof(vantor_metadata_3, plugin_version), 3 * word);
    EXPECT_EQ(offsetof(vantor_metadata_3, run_once), 4 * word);
    EXPECT_EQ(offsetof(vantor_metadata_3, required_flags), 5 * word);
    EXPECT_EQ(offsetof(vantor_metadata_3, disabling_flags), 6 * word);
    EXPECT_EQ(sizeof(vantor_metadata_3), 7 * word);
    EXPECT_EQ(offsetof(vantor_operations, apply_host_profile), word);
}

}  // namespace
}  // namespace vantor
