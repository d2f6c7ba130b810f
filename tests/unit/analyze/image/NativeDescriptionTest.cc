// What is read from shared objects without loading them.

#include "image/NativeDescription.h"

#include <elf.h>
#include <gmock/gmock.h>

#include "analyze/image/ElfBuilder.h"

namespace vantor::analyze {

namespace {

using support::ElfBuilder;
using support::PluginRecords;
using ::testing::ElementsAre;
using ::testing::IsEmpty;

std::vector<std::string> NamesOf(const std::vector<BarrierName>& barriers) {
    std::vector<std::string> names;
    for (const BarrierName& barrier : barriers) {
        names.push_back(barrier.name);
    }
    return names;
}

class NativeDescriptionTest : public ::testing::TestWithParam<Architecture> {
protected:
    NativeDescriptionTest() { records.start = ElfBuilder::To(builder.Bytes("code")); }

    std::optional<NativeReading> Read(const std::string& content) {
        findings.clear();
        return ReadNative(content, GetParam(), {{"dir/libx.so", 0, 0}, "/dir/libx.so"}, findings);
    }
    std::optional<NativeReading> Read() {
        records.AddTo(builder);
        return Read(builder.Finish());
    }
    // "code: text" of each.
    std::vector<std::string> Found() const {
        std::vector<std::string> texts;
        for (const Finding& finding : findings) {
            texts.push_back(finding.code + ": " + finding.text);
        }
        return texts;
    }

    ElfBuilder builder{GetParam()};
    PluginRecords records;
    Findings findings;
};

INSTANTIATE_TEST_SUITE_P(All, NativeDescriptionTest,
                         ::testing::Values(support::x86, support::x86With64Bits, support::arm,
                                           support::armWith64Bits),
                         [](const auto& one) {
                             return "Machine" + std::to_string(one.param.machine);
                         });

TEST_P(NativeDescriptionTest, EveryFieldOfTheLongRecordIsRead) {
    records.provided = ElfBuilder::To(builder.Names({"a", "b", "a"}));
    records.required = ElfBuilder::To(builder.Names({"c"}));
    records.requiredFlags = ElfBuilder::To(builder.Names({"z", "y", "z"}));
    records.disablingFlags = ElfBuilder::To(builder.Names({"off"}));
    records.pluginVersion = ElfBuilder::To(builder.Text("1.2-3"));
    records.runOnce = 1;
    const std::optional<NativeReading> reading = Read();
    EXPECT_THAT(Found(), IsEmpty());
    ASSERT_TRUE(reading);
    const PluginDescription& plugin = reading->plugin;
    EXPECT_EQ(plugin.apiVersion, 4);
    EXPECT_THAT(NamesOf(plugin.provided), ElementsAre("a", "b", "a"));
    EXPECT_THAT(NamesOf(plugin.required), ElementsAre("c"));
    EXPECT_THAT(plugin.requiredFlags, ElementsAre("y", "z"));
    EXPECT_THAT(plugin.disablingFlags, ElementsAre("off"));
    EXPECT_EQ(plugin.pluginVersion, "1.2-3");
    EXPECT_TRUE(plugin.runOnce);
    EXPECT_EQ(plugin.kind, PluginKind::Native);
    EXPECT_EQ(plugin.place.path, "dir/libx.so");
}

TEST_P(NativeDescriptionTest, OlderVersionsHaveNoMoreThanBarriers) {
    records.version = 2;
    records.provided = ElfBuilder::To(builder.Names({"a"}));
    records.requiredFlags = ElfBuilder::To(1);  // would be out of bounds
    records.runOnce = 1;
    const std::optional<NativeReading> reading = Read();
    EXPECT_THAT(Found(), IsEmpty());
    ASSERT_TRUE(reading);
    EXPECT_EQ(reading->plugin.apiVersion, 2);
    EXPECT_THAT(NamesOf(reading->plugin.provided), ElementsAre("a"));
    EXPECT_FALSE(reading->plugin.runOnce);
}

TEST_P(NativeDescriptionTest, NullListsAreEmpty) {
    const std::optional<NativeReading> reading = Read();
    EXPECT_THAT(Found(), IsEmpty());
    ASSERT_TRUE(reading);
    EXPECT_THAT(reading->plugin.provided, IsEmpty());
    EXPECT_EQ(reading->plugin.pluginVersion, "");
}

TEST_P(NativeDescriptionTest, AVersionThatNobodySupportsIsRejectedAsTheBootDoes) {
    for (const std::int32_t version : {0, 5, -1}) {
        records.version = version;
        builder = ElfBuilder(GetParam());
        EXPECT_FALSE(Read());
        EXPECT_THAT(Found(), ElementsAre("unsupported-version: plugin `/dir/libx.so' is invalid: "
                                         "Unsupported API version"));
    }
}

TEST_P(NativeDescriptionTest, ANullStartEntryIsTold) {
    records.start = ElfBuilder::Null();
    EXPECT_TRUE(Read());
    EXPECT_THAT(Found(), ElementsAre("null-start: the start entry is null: the boot runs nothing"));
}

TEST_P(NativeDescriptionTest, AMissingRecordIsToldInTheLinkersWords) {
    builder.Add({"metadata", builder.Words({ElfBuilder::Null()})});
    EXPECT_FALSE(Read(builder.Finish()));
    EXPECT_THAT(Found(), ElementsAre("rejected: plugin `/dir/libx.so' is invalid: /dir/libx.so: "
                                     "undefined symbol: operations"));
}

TEST_P(NativeDescriptionTest, HiddenSymbolsAreNotFound) {
    builder.Add({"operations", builder.Words({ElfBuilder::Null()}), 0, STV_HIDDEN});
    EXPECT_FALSE(Read(builder.Finish()));
    EXPECT_THAT(Found(), ElementsAre("rejected: plugin `/dir/libx.so' is invalid: /dir/libx.so: "
                                     "undefined symbol: operations"));
}

TEST_P(NativeDescriptionTest, APointerOutOfTheFileIsTold) {
    records.required = ElfBuilder::To(0x7fff0000);
    EXPECT_FALSE(Read());
    EXPECT_THAT(Found(),
                ElementsAre("bad-record: the list of required barriers is not in the file"));
}

TEST_P(NativeDescriptionTest, AStartEntryOutOfTheFileIsTold) {
    records.start = ElfBuilder::To(0x7fff0000);
    EXPECT_FALSE(Read());
    EXPECT_THAT(Found(), ElementsAre("bad-record: the start entry points out of the file"));
}

TEST_P(NativeDescriptionTest, OfAListInAnotherObjectItIsToldThatNothingIsKnown) {
    builder.Add({"elsewhere"});
    records.provided = ElfBuilder::ToSymbol("elsewhere");
    records.required = ElfBuilder::To(builder.Names({"a"}));
    const std::optional<NativeReading> reading = Read();
    EXPECT_THAT(Found(),
                ElementsAre("undetermined: the list of provided barriers lies in another object: "
                            "only loading the plugin tells what it says there, so that is not "
                            "looked at"));
    ASSERT_TRUE(reading);
    EXPECT_THAT(reading->plugin.provided, IsEmpty());
    EXPECT_THAT(NamesOf(reading->plugin.required), ElementsAre("a"));
    EXPECT_THAT(reading->sharedParts, IsEmpty());
}

TEST_P(NativeDescriptionTest, PartsThatAreLookedUpByAnExportedNameAreNamed) {
    builder.Add({"begin", builder.Bytes("code")});
    builder.Add({"mine", builder.Bytes("code"), 0, STV_PROTECTED});
    builder.Add({"gives", builder.Names({"a"})});
    records.start = ElfBuilder::ToSymbol("begin");
    records.applyHostProfile = ElfBuilder::ToSymbol("mine");
    records.provided = ElfBuilder::ToSymbol("gives");
    const std::optional<NativeReading> reading = Read();
    EXPECT_THAT(Found(), IsEmpty());
    ASSERT_TRUE(reading);
    EXPECT_THAT(NamesOf(reading->plugin.provided), ElementsAre("a"));
    ASSERT_EQ(reading->sharedParts.size(), 2U);
    EXPECT_EQ(reading->sharedParts[0].what, "the list of provided barriers");
    EXPECT_EQ(reading->sharedParts[0].symbol.name, "gives");
    EXPECT_EQ(reading->sharedParts[1].what, "the start entry");
    EXPECT_EQ(reading->sharedParts[1].symbol.name, "begin");
}

TEST_P(NativeDescriptionTest, AnObjectThatLooksInItselfFirstSharesNothing) {
    builder.AddDynamic(DT_SYMBOLIC, 0);
    builder.Add({"begin", builder.Bytes("code")});
    records.start = ElfBuilder::ToSymbol("begin");
    const std::optional<NativeReading> reading = Read();
    ASSERT_TRUE(reading);
    EXPECT_THAT(reading->sharedParts, IsEmpty());
}

TEST_P(NativeDescriptionTest, ARecordThatIsShorterThanItsVersionIsTold) {
    const std::uint64_t word = GetParam().WordSize();
    builder.Add(
        {"metadata",
         builder.Words(
             {{1, ElfBuilder::Word::How::Plain, {}}, ElfBuilder::Null(), ElfBuilder::Null()}),
         2 * word});
    builder.Add({"operations", builder.Words({records.start})});
    EXPECT_TRUE(Read(builder.Finish()));
    EXPECT_THAT(Found(),
                ElementsAre("short-record: the record \"metadata\" is " + std::to_string(2 * word) +
                            " bytes long; of version 1 the boot reads " +
                            std::to_string(3 * word)));
}

TEST_P(NativeDescriptionTest, AListWithoutANullPointerIsTold) {
    const ElfBuilder::Word name = ElfBuilder::To(builder.Text("a"));
    records.provided = ElfBuilder::To(builder.WordsAtTheEnd({name, name}));
    EXPECT_FALSE(Read());
    EXPECT_THAT(Found(), ElementsAre("bad-record: the list of provided barriers has no null "
                                     "pointer at its end"));
}

TEST_P(NativeDescriptionTest, AFileThatIsCutOffAnywhereIsRejectedAndNothingElse) {
    records.provided = ElfBuilder::To(builder.Names({"a", "b"}));
    records.AddTo(builder);
    const std::string whole = builder.Finish();
    for (std::size_t size = 0; size < whole.size(); ++size) {
        EXPECT_FALSE(Read(whole.substr(0, size))) << size;
        ASSERT_EQ(findings.size(), 1U) << size;
        EXPECT_TRUE(findings[0].code == "rejected" || findings[0].code == "truncated")
            << size << findings[0].code;
    }
    EXPECT_TRUE(Read(whole));
}

TEST_P(NativeDescriptionTest, AnyByteMayBeWrong) {
    records.provided = ElfBuilder::To(builder.Names({"a", "b"}));
    records.AddTo(builder);
    const std::string whole = builder.Finish();
    for (std::size_t i = 0; i < whole.size(); ++i) {
        for (const char byte : {'\0', '\x01', '\x7f', '\xff'}) {
            std::string changed = whole;
            changed[i] = byte;
            const bool isRead = Read(changed).has_value();
            EXPECT_TRUE(isRead || !findings.empty()) << i;
        }
    }
}

// Its relocations are not known: nothing is guessed from the words that they stand for.
TEST(NativeArchitectureTest, AnObjectOfAnUnknownMachineIsNotGuessedAt) {
    const Architecture unknown{ELFCLASS32, ELFDATA2MSB, EM_PPC};
    ElfBuilder builder(unknown);
    PluginRecords records;
    records.provided = ElfBuilder::To(builder.Names({"a"}));
    records.AddTo(builder);
    Findings findings;
    EXPECT_FALSE(ReadNative(builder.Finish(), unknown, {{"x.so", 0, 0}, "/x.so"}, findings));
    ASSERT_EQ(findings.size(), 1U);
    EXPECT_EQ(findings[0].code, "bad-record");
    EXPECT_EQ(findings[0].text,
              "the list of provided barriers cannot be found: the pointer to it is not in the "
              "file, or relocated in an unknown way");
}

TEST(NativeArchitectureTest, AnObjectForAnotherMachineIsToldWithBoth) {
    ElfBuilder builder(support::armWith64Bits);
    PluginRecords().AddTo(builder);
    Findings findings;
    EXPECT_FALSE(ReadNative(builder.Finish(), support::x86, {{"x.so", 0, 0}, "/x.so"}, findings));
    ASSERT_EQ(findings.size(), 1U);
    EXPECT_EQ(findings[0].code, "foreign-architecture");
    EXPECT_EQ(findings[0].text, "plugin `/x.so' is invalid: /x.so: wrong ELF class: ELFCLASS64 "
                                "(made for 64-bit AArch64, the boot is for 32-bit Intel 80386)");
}

}  // namespace

}  // namespace vantor::analyze
