// What the dynamic linker would make of plugins together with the program and the libraries.

#include "image/LinkScope.h"

#include <elf.h>
#include <gmock/gmock.h>

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
        plugins.push_back({name, Object(text), isKept});
    }

    // Tells of the plugins; the paths of those that are refused.
    std::set<std::string> Report() {
        LinkScope scope(image, GetParam());
        for (const Plugin& plugin : plugins) {
            const ElfFile file(plugin.content);
            const PluginSource source{{"/p/" + plugin.name, 0, 0}, "/p/" + plugin.name};
            scope.Open(source, ReadLinkage(SharedObject(file)));
            if (plugin.isKept) {
                scope.Keep(source);
            }
        }
        return scope.Report(findings);
    }

private:
    struct Plugin {
        std::string name;
        std::string content;
        bool isKept;
    };
    std::vector<Plugin> plugins;
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

TEST_P(LinkScopeTest, APluginThatIsAnothersLibraryDependsOnTheOrderToo) {
    WriteProgram({});
    WritePlugin("a.so", {{"libb.so"}, {}, {"shared"}, {}});
    WritePlugin("b.so", {{}, {"shared"}, {}, "libb.so"});
    EXPECT_THAT(Report(), IsEmpty());
    EXPECT_THAT(Found("load-order"),
                ElementsAre("/p/a.so:0 warning load-order: the library \"libb.so\" is that of "
                            "/p/b.so: the boot loads this one only if the directory lists that "
                            "one before it",
                            "/p/a.so:0 warning load-order: the symbol \"shared\" is that of "
                            "/p/b.so: the boot loads this one only if the directory lists that "
                            "one before it"));
}

TEST_P(LinkScopeTest, TheExporterOfASymbolIsTheFirstThatTheLinkerFinds) {
    WriteProgram({{"libx.so", "liby.so"}, {}, {}, {}});
    WriteLibrary("libx.so", {{}, {"x", "both"}, {}, {}});
    WriteLibrary("liby.so", {{}, {"y", "both"}, {}, {}});
    const LinkScope scope(image, GetParam());
    EXPECT_EQ(scope.Exporter("both"), "/usr/lib/libx.so");
    EXPECT_EQ(scope.Exporter("y"), "/usr/lib/liby.so");
    EXPECT_EQ(scope.Exporter("z"), "");
}

INSTANTIATE_TEST_SUITE_P(AllArchitectures, LinkScopeTest,
                         ::testing::Values(support::x86, support::x86With64Bits, support::arm,
                                           support::armWith64Bits));

}  // namespace

}  // namespace vantor::analyze
