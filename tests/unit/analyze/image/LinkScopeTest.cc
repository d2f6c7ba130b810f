// What the dynamic linker would make of plugins together with the program and the libraries.

#include "image/LinkScope.h"

#include <elf.h>
#include <gmock/gmock.h>
#include <unistd.h>

#include "analyze/image/ElfBuilder.h"
#include "analyze/image/HostFixture.h"

namespace vantor::analyze {

namespace {

using support::ElfBuilder;
using ::testing::ElementsAre;
using ::testing::IsEmpty;

// What an object is to need and to offer.
struct ObjectText {
    std::vector<std::string> needed;
    std::vector<std::string> exports;
    std::vector<std::string> imports;  // by data
    std::string soname;
};

class LinkScopeTest : public support::HostFixture,
                      public ::testing::WithParamInterface<Architecture> {
protected:
    static std::string Object(const ObjectText& text) {
        ElfBuilder builder(GetParam());
        for (const std::string& library : text.needed) {
            builder.AddDynamic(DT_NEEDED, library);
        }
        if (!text.soname.empty()) {
            builder.AddDynamic(DT_SONAME, text.soname);
        }
        for (const std::string& symbol : text.exports) {
            builder.Add({symbol, builder.Bytes("data")});
        }
        for (const std::string& symbol : text.imports) {
            builder.Add({symbol});
            builder.Words({ElfBuilder::ToSymbol(symbol)});
        }
        return builder.Finish();
    }
    void WriteProgram(const ObjectText& text) const { Write(HostImage::program, Object(text)); }
    void WriteLibrary(const std::string& name, const ObjectText& text) const {
        Write("/usr/lib/" + name, Object(text));
    }
    void WritePlugin(const std::string& name, const ObjectText& text, bool isKept = true) {
        plugins.push_back({name, Object(text), isKept, {0, 0}});
    }

    // Tells of the plugins; the paths of those that are refused.
    std::set<std::string> Report() {
        LinkScope scope(image, GetParam());
        for (const Plugin& plugin : plugins) {
            const ElfFile file(plugin.content);
            const PluginSource source{
                {"/p/" + plugin.name, 0, 0}, "/p/" + plugin.name, plugin.file};
            const std::size_t opened = scope.Open(source, Linkage(SharedObject(file)));
            if (plugin.isKept) {
                scope.Keep(opened, parts);
            }
        }
        return scope.Report(findings);
    }

    struct Plugin {
        std::string name;
        std::string content;
        bool isKept;
        std::pair<std::uint64_t, std::uint64_t> file;
    };
    std::vector<Plugin> plugins;
    std::vector<SharedPart> parts;  // of each plugin
};

TEST_P(LinkScopeTest, WithoutABootProgramNothingIsChecked) {
    WritePlugin("a.so", {{"libnone.so"}, {}, {}, {}});
    EXPECT_THAT(Report(), IsEmpty());
    EXPECT_THAT(Found(),
                ElementsAre("/usr/sbin/vantor:0 note unchecked-objects: what native plugins need "
                            "of other objects is not checked: there is no boot program "
                            "/usr/sbin/vantor to tell what they are loaded into"));
}

TEST_P(LinkScopeTest, WithoutNativePluginsNothingIsTold) {
    EXPECT_THAT(Report(), IsEmpty());
    EXPECT_THAT(Found(), IsEmpty());
}

TEST_P(LinkScopeTest, AProgramThatLacksALibraryOfItsOwnIsTold) {
    WriteProgram({{"libnone.so"}, {}, {}, {}});
    WritePlugin("a.so", {});
    EXPECT_THAT(Report(), IsEmpty());
    EXPECT_THAT(Found(),
                ElementsAre("/usr/sbin/vantor:0 error missing-library: the boot program cannot "
                            "start: its library libnone.so is not found",
                            "/usr/sbin/vantor:0 note unchecked-objects: what native plugins need "
                            "of other objects is not checked"));
}

TEST_P(LinkScopeTest, WhatTheProgramAndItsLibrariesHaveServesPlugins) {
    WriteProgram({{"libc.so"}, {"ofProgram"}, {}, {}});
    WriteLibrary("libc.so", {{"libdeep.so"}, {"ofLibrary"}, {}, "libc.so"});
    WriteLibrary("libdeep.so", {{}, {"ofDeepLibrary"}, {}, {}});
    WritePlugin("a.so",
                {{"libc.so", "libdeep.so"}, {}, {"ofProgram", "ofLibrary", "ofDeepLibrary"}, {}});
    EXPECT_THAT(Report(), IsEmpty());
    EXPECT_THAT(Found(), IsEmpty());
}

TEST_P(LinkScopeTest, AMissingLibraryIsToldInTheLinkersWords) {
    WriteProgram({});
    WritePlugin("a.so", {{"libnone.so.1"}, {}, {"symbol"}, {}});
    EXPECT_THAT(Report(), ElementsAre("/p/a.so"));
    EXPECT_THAT(Found(), ElementsAre("/p/a.so:0 error missing-library: plugin `/p/a.so' is "
                                     "invalid: libnone.so.1: cannot open shared object file: No "
                                     "such file or directory"));
}

TEST_P(LinkScopeTest, ALibrarysMissingLibraryIsToldToo) {
    WriteProgram({});
    WriteLibrary("libx.so", {{"libnone.so"}, {}, {}, {}});
    WritePlugin("a.so", {{"libx.so"}, {}, {}, {}});
    EXPECT_THAT(Report(), ElementsAre("/p/a.so"));
    EXPECT_THAT(Found(), ElementsAre("/p/a.so:0 error missing-library: plugin `/p/a.so' is "
                                     "invalid: libnone.so: cannot open shared object file: No "
                                     "such file or directory"));
}

TEST_P(LinkScopeTest, AFileThatIsNoLibraryIsNotFound) {
    WriteProgram({});
    Write("/usr/lib/libx.so", "no ELF file");
    WritePlugin("a.so", {{"libx.so"}, {}, {}, {}});
    EXPECT_THAT(Report(), ElementsAre("/p/a.so"));
}

TEST_P(LinkScopeTest, LibrariesThatNeedEachOtherAreReadOnce) {
    WriteProgram({});
    WriteLibrary("libx.so", {{"liby.so"}, {"x"}, {}, {}});
    WriteLibrary("liby.so", {{"libx.so"}, {"y"}, {"x"}, {}});
    WritePlugin("a.so", {{"libx.so"}, {}, {"x", "y"}, {}});
    EXPECT_THAT(Report(), IsEmpty());
    EXPECT_THAT(Found(), IsEmpty());
}

TEST_P(LinkScopeTest, AnUndefinedSymbolIsToldInTheLinkersWords) {
    WriteProgram({});
    WritePlugin("a.so", {{}, {}, {"nowhere"}, {}});
    EXPECT_THAT(Report(), ElementsAre("/p/a.so"));
    EXPECT_THAT(Found(), ElementsAre("/p/a.so:0 error undefined-symbol: plugin `/p/a.so' is "
                                     "invalid: /p/a.so: undefined symbol: nowhere"));
}

TEST_P(LinkScopeTest, AnUndefinedSymbolOfALibraryIsThatOfThePlugin) {
    WriteProgram({});
    WriteLibrary("libx.so", {{}, {}, {"nowhere", "ofPlugin"}, {}});
    WritePlugin("a.so", {{"libx.so"}, {"ofPlugin"}, {}, {}});
    EXPECT_THAT(Report(), ElementsAre("/p/a.so"));
    EXPECT_THAT(Found(), ElementsAre("/p/a.so:0 error undefined-symbol: plugin `/p/a.so' is "
                                     "invalid: /usr/lib/libx.so: undefined symbol: nowhere"));
}

TEST_P(LinkScopeTest, WhatOnlyAnotherPluginDefinesDependsOnTheOrder) {
    WriteProgram({});
    WritePlugin("a.so", {{}, {}, {"shared"}, {}});
    WritePlugin("b.so", {{}, {"shared"}, {}, {}});
    EXPECT_THAT(Report(), IsEmpty());
    EXPECT_THAT(Found(),
                ElementsAre("/p/a.so:0 warning load-order: the symbol \"shared\" is that of "
                            "/p/b.so: the boot loads this one only if the directory lists that "
                            "one before it"));
}

TEST_P(LinkScopeTest, APluginThatIsNotKeptServesNobody) {
    WriteProgram({});
    WritePlugin("a.so", {{}, {}, {"shared"}, {}});
    WritePlugin("b.so", {{}, {"shared"}, {}, {}}, false);
    EXPECT_THAT(Report(), ElementsAre("/p/a.so"));
}

TEST_P(LinkScopeTest, APluginThatIsRefusedServesNobodyHoweverLongTheChain) {
    WriteProgram({});
    WritePlugin("a.so", {{}, {"a"}, {"b"}, {}});
    WritePlugin("b.so", {{}, {"b"}, {"c"}, {}});
    WritePlugin("c.so", {{"libnone.so"}, {"c"}, {}, {}});
    EXPECT_THAT(Report(), ElementsAre("/p/a.so", "/p/b.so", "/p/c.so"));
    EXPECT_EQ(Found().size(), 3U);
}

TEST_P(LinkScopeTest, APluginThatIsAnothersLibraryDependsOnTheOrderToo) {
    WriteProgram({});
    WriteLibrary("libx.so", {{}, {"x"}, {}, {}});
    WritePlugin("a.so", {{"libb.so", "libx.so"}, {}, {"shared", "x"}, {}});
    WritePlugin("b.so", {{}, {"shared"}, {}, "libb.so"});
    EXPECT_THAT(Report(), IsEmpty());
    EXPECT_THAT(Found(),
                ElementsAre("/p/a.so:0 warning load-order: the library \"libb.so\" is that of "
                            "/p/b.so: the boot loads this one only if the directory lists that "
                            "one before it"));
}

TEST_P(LinkScopeTest, WhatOthersBringWithThemDependsOnTheOrder) {
    WriteProgram({});
    Write("/opt/liby.so", Object({{}, {"y"}, {}, "liby.so"}));
    WritePlugin("a.so", {{"/opt/liby.so"}, {}, {}, {}});
    WritePlugin("b.so", {{"liby.so"}, {}, {}, {}});
    WritePlugin("c.so", {{}, {}, {"y"}, {}});
    EXPECT_THAT(Report(), IsEmpty());
    EXPECT_THAT(Found(),
                ElementsAre("/p/b.so:0 warning load-order: the library \"liby.so\" is that of "
                            "/p/a.so: the boot loads this one only if the directory lists that "
                            "one before it",
                            "/p/c.so:0 warning load-order: the symbol \"y\" is that of "
                            "/opt/liby.so: the boot loads this one only if the directory lists "
                            "that one before it"));
}

TEST_P(LinkScopeTest, APartThatAnotherExportsTooIsToldOfEach) {
    WriteProgram({{"libc.so"}, {}, {}, {}});
    WriteLibrary("libc.so", {{}, {"sync"}, {}, {}});
    WriteLibrary("libx.so", {{}, {"begin"}, {}, {}});
    parts = {{"the start entry", {"start", {}}},
             {"the plugin version", {"sync", {}}},
             {"a list", {"begin", {}}},
             {"another", {"alone", {}}}};
    WritePlugin("a.so", {{}, {"start", "alone"}, {}, {}});
    EXPECT_THAT(Report(), IsEmpty());
    EXPECT_THAT(Found(), ElementsAre("/p/a.so:0 error taken-over: the plugin version is looked up "
                                     "by its exported name \"sync\", which is exported by "
                                     "/usr/lib/libc.so too, which the boot program has loaded "
                                     "before: it serves this plugin"));
    findings.clear();
    WritePlugin("b.so", {{"libx.so"}, {"start"}, {}, {}});
    Report();
    const std::vector<std::string> found = Found();
    ASSERT_EQ(found.size(), 6U);
    EXPECT_EQ(found[0], "/p/a.so:0 error taken-over: the start entry is looked up by its exported "
                        "name \"start\", which is exported by /p/b.so too: whichever is loaded "
                        "first serves all of them");
    EXPECT_EQ(found[2], "/p/a.so:0 error taken-over: a list is looked up by its exported name "
                        "\"begin\", which is exported by /usr/lib/libx.so too: whichever is "
                        "loaded first serves all of them");
}

TEST_P(LinkScopeTest, OfManyThatTakeAPartOverThreeAreNamed) {
    WriteProgram({});
    parts = {{"the start entry", {"start", {}}}};
    for (const char* const name : {"a", "b", "c", "d", "e", "f"}) {
        WritePlugin(name, {{}, {"start"}, {}, {}});
    }
    Report();
    EXPECT_EQ(Found().back(), "/p/f:0 error taken-over: the start entry is looked up by its "
                              "exported name \"start\", which is exported by /p/a, /p/b, /p/c and "
                              "others too: whichever is loaded first serves all of them");
}

TEST_P(LinkScopeTest, OneFileUnderTwoNamesTakesNothingOver) {
    WriteProgram({});
    parts = {{"the start entry", {"start", {}}}};
    WritePlugin("a.so", {{}, {"start"}, {}, {}});
    WritePlugin("b.so", {{}, {"start"}, {}, {}});
    for (Plugin& plugin : plugins) {
        plugin.file = {3, 4};
    }
    EXPECT_THAT(Report(), IsEmpty());
    EXPECT_THAT(Found(), IsEmpty());
}

TEST_P(LinkScopeTest, TheBootProgramMayBeALink) {
    Write("/opt/v/bin/vantor", Object({{"$ORIGIN/../lib/libx.so"}, {}, {}, {}}));
    Write("/opt/v/lib/libx.so", Object({{}, {"x"}, {}, {}}));
    boost::filesystem::create_directories(folder.Path() + "/usr/sbin");
    ASSERT_EQ(symlink("/opt/v/bin/vantor", folder.File("usr/sbin/vantor").c_str()), 0);
    WritePlugin("a.so", {{}, {}, {"x"}, {}});
    EXPECT_THAT(Report(), IsEmpty());
    EXPECT_THAT(Found(), IsEmpty());
}

// One that is too large to be read stands for one that only root can read: root runs tests too.
TEST_P(LinkScopeTest, ALibraryThatCannotBeReadHereIsNotAtFault) {
    WriteProgram({});
    WriteLibrary("libx.so", {{}, {"x"}, {}, {}});
    constexpr off_t tooLarge = (off_t{1} << 30) + 1;
    ASSERT_EQ(truncate(folder.File("usr/lib/libx.so").c_str(), tooLarge), 0);
    WritePlugin("a.so", {{"libx.so"}, {}, {"x"}, {}});
    EXPECT_THAT(Report(), IsEmpty());
    EXPECT_THAT(Found(), ElementsAre("/p/a.so:0 note unchecked-objects: its library "
                                     "/usr/lib/libx.so cannot be read: File too large"));
}

TEST_P(LinkScopeTest, WhatAPluginsOwnLibrariesDefineIsFoundInIt) {
    WriteProgram({});
    WriteLibrary("libx.so", {{}, {"x"}, {}, {}});
    LinkScope scope(image, GetParam());
    const std::string content = Object({{"libx.so"}, {"own"}, {}, {}});
    const ElfFile file(content);
    const std::size_t plugin =
        scope.Open({{"/p/a.so", 0, 0}, "/p/a.so"}, Linkage(SharedObject(file)));
    EXPECT_TRUE(scope.LibrariesDefine(plugin, "x"));
    EXPECT_FALSE(scope.LibrariesDefine(plugin, "own"));
}

INSTANTIATE_TEST_SUITE_P(AllArchitectures, LinkScopeTest,
                         ::testing::Values(support::x86, support::x86With64Bits, support::arm,
                                           support::armWith64Bits));

}  // namespace

}  // namespace vantor::analyze
