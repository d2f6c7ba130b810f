#include "image/DirectoryReader.h"

#include <gmock/gmock.h>
#include <sys/stat.h>
#include <unistd.h>

#include <system_error>

#include "analyze/image/ElfBuilder.h"
#include "analyze/image/HostFixture.h"
#include "json/DocumentText.h"

namespace vantor::analyze {

namespace {

using support::DocumentText;
using support::ElfBuilder;
using ::testing::ElementsAre;
using ::testing::IsEmpty;

class DirectoryReaderTest : public support::HostFixture {
protected:
    DirectoryReaderTest() {
        boost::filesystem::create_directories(folder.Path() + HostImage::pluginDirectory);
        boost::filesystem::create_directories(folder.Path() + HostImage::commandDescriptions);
        chmod(folder.Path().c_str(), 0755);
    }

    void WritePlugin(const std::string& name, const std::string& content) const {
        Write(std::string(HostImage::pluginDirectory) + "/" + name, content);
    }
    static std::string Object(const Architecture& architecture) {
        ElfBuilder builder(architecture);
        support::PluginRecords records;
        records.provided = ElfBuilder::To(builder.Names({"ready"}));
        records.start = ElfBuilder::To(builder.Bytes("code"));
        records.AddTo(builder);
        return builder.Finish();
    }
    // The plugins' names, in order.
    std::vector<std::string> Read() {
        model = ReadPlugins(image, options, findings);
        std::vector<std::string> names;
        for (const PluginDescription& plugin : model.plugins) {
            names.push_back(plugin.name);
        }
        return names;
    }
    // As Found(), without the plugin directory before each, and without that there is no program.
    std::vector<std::string> Told() const {
        std::vector<std::string> texts = Found();
        texts.erase(std::remove_if(texts.begin(), texts.end(),
                                   [](const std::string& text) {
                                       return text.find(" unchecked-objects: ") !=
                                              std::string::npos;
                                   }),
                    texts.end());
        const std::string start = std::string(HostImage::pluginDirectory) + "/";
        for (std::string& text : texts) {
            if (text.compare(0, start.size(), start) == 0) {
                text.erase(0, start.size());
            }
        }
        return texts;
    }

    BootOptions options;
    BootModel model;
};

TEST_F(DirectoryReaderTest, PluginsComeByFileNameAndDebugEntriesBehindThem) {
    WritePlugin("libz.so", Object(support::x86));
    WritePlugin("a.so", Object(support::x86));
    WritePlugin("libm.json", DocumentText().Text());
    WritePlugin("x.debug", "");
    Write(HostImage::debugConfiguration, "y:a:b:c\nx:a:b:c\n");
    EXPECT_THAT(Read(), ElementsAre("a", "m", "z", "x", "y", "x"));
    EXPECT_THAT(Told(), ElementsAre("/etc/nuvex/vantor/debug.conf:2 warning entry-twice: the "
                                    "entry \"x\" runs twice: for itself and for the marker "
                                    "/usr/libexec/vantor/plugins/x.debug"));
    EXPECT_THAT(model.barriers.at("ready").providers, ElementsAre(0, 2));
    EXPECT_EQ(model.plugins[0].place.path, "/usr/libexec/vantor/plugins/a.so");
}

TEST_F(DirectoryReaderTest, FilesOfNoKindAreToldInTheBootsWords) {
    WritePlugin("README", "");
    WritePlugin("libfoo.so.1", "");
    WritePlugin("foo.", "");
    EXPECT_THAT(Read(), IsEmpty());
    EXPECT_THAT(Told(),
                ElementsAre("README:0 warning ignored-file: ignoring plugin 'README' of "
                            "unspecified type...",
                            "foo.:0 warning ignored-file: ignoring plugin 'foo.' of unknown type "
                            "()...",
                            "libfoo.so.1:0 warning ignored-file: ignoring plugin 'libfoo.so.1' of "
                            "unknown type (1)..."));
}

TEST_F(DirectoryReaderTest, EntriesThatAreNoRegularFilesAreRejectedAsTheBootDoes) {
    const std::string directory = folder.Path() + HostImage::pluginDirectory;
    ASSERT_EQ(mkdir((directory + "/a.so").c_str(), 0755), 0);
    ASSERT_EQ(mkfifo((directory + "/b.so").c_str(), 0600), 0);
    ASSERT_EQ(symlink("nowhere", (directory + "/c.so").c_str()), 0);
    ASSERT_EQ(mkfifo((directory + "/d.json").c_str(), 0600), 0);
    ASSERT_EQ(mkdir((directory + "/e.json").c_str(), 0755), 0);
    EXPECT_THAT(Read(), IsEmpty());
    const std::string start = " error rejected: plugin `/usr/libexec/vantor/plugins/";
    const std::string path = "/usr/libexec/vantor/plugins/";
    EXPECT_THAT(Told(),
                ElementsAre("a.so:0" + start + "a.so' is invalid: " + path +
                                "a.so: cannot read file data: Is a directory",
                            "b.so:0" + start + "b.so' is invalid: not a regular file",
                            "c.so:0" + start + "c.so' is invalid: " + path +
                                "c.so: cannot open shared object file: No such file or directory",
                            "d.json:0" + start + "d.json' is invalid: no such file or directory",
                            "e.json:0" + start + "e.json' is invalid: no such file or directory"));
}

TEST_F(DirectoryReaderTest, MostObjectsDecideWhichAreForeign) {
    WritePlugin("a.so", Object(support::arm));
    WritePlugin("b.so", Object(support::x86));
    WritePlugin("c.so", Object(support::x86));
    EXPECT_THAT(Read(), ElementsAre("b", "c"));
    EXPECT_EQ(Found("foreign-architecture").size(), 1U);
}

TEST_F(DirectoryReaderTest, TheHostsProgramDecidesBeforeThem) {
    Write(HostImage::program, Object(support::arm));
    WritePlugin("a.so", Object(support::arm));
    WritePlugin("b.so", Object(support::x86));
    WritePlugin("c.so", Object(support::x86));
    EXPECT_THAT(Read(), ElementsAre("a"));
    EXPECT_EQ(Found("foreign-architecture").size(), 2U);
}

TEST_F(DirectoryReaderTest, FiltersDecideAsTheBootsDo) {
    DocumentText document;
    document.metadata["disabling_flags"] = "[\"off\"]";
    WritePlugin("a.json", document.Text());
    document = DocumentText();
    document.metadata["required_flags"] = "[\"on\"]";
    WritePlugin("b.json", document.Text());
    WritePlugin("c.json", DocumentText().Text());
    options.flags = {"off"};
    options.disabledPlugins = {"c"};
    Read();
    EXPECT_EQ(model.plugins[0].fate, PluginFate::Filtered);
    EXPECT_EQ(model.plugins[0].fateReason, "ignoring plugin 'a', disabled due to boot flags: off ");
    EXPECT_EQ(model.plugins[1].fateReason,
              "ignoring plugin 'b', disabled due to missing required boot flags: on ");
    EXPECT_EQ(model.plugins[2].fateReason, "ignoring plugin 'c' due to blacklist");
}

TEST_F(DirectoryReaderTest, ARunOncePluginIsAskedForByItsKeyAndRecordedByTheCleanedOne) {
    DocumentText document;
    document.metadata["run_once"] = "true";
    document.metadata["plugin_version"] = "\"1 0\"";
    WritePlugin("a.json", document.Text());
    WritePlugin("liba.json", document.Text());
    document.metadata["plugin_version"] = "\"10\"";
    WritePlugin("lib.a.json", document.Text());
    WritePlugin("libb.json", document.Text());
    options.runOncePlugins = {"b10"};
    EXPECT_THAT(Read(), ElementsAre("a", ".a", "a", "b"));
    EXPECT_EQ(model.plugins[0].fate, PluginFate::Runs);
    EXPECT_EQ(model.plugins[2].fate, PluginFate::Runs);
    EXPECT_EQ(model.plugins[3].fate, PluginFate::AlreadyRun);
    EXPECT_EQ(model.plugins[3].fateReason,
              "ignoring plugin 'b' because version '10' has already been run");
}

TEST_F(DirectoryReaderTest, ADirectoryThatCannotBeReadIsAnError) {
    options.directory = "/nowhere";
    EXPECT_THROW(Read(), std::system_error);
}

TEST_F(DirectoryReaderTest, WhatOthersMayWriteIsTold) {
    WritePlugin("a.json", DocumentText().Text());
    chmod((folder.Path() + HostImage::pluginDirectory + "/a.json").c_str(), 0646);
    Read();
    EXPECT_THAT(Told(), ElementsAre("a.json:0 warning writable: can be written by others than "
                                    "root: everybody (mode 0646)"));
}

TEST_F(DirectoryReaderTest, WhoMayChangeTheProgramOrItsCommandsIsTold) {
    WritePlugin("a.json", DocumentText().Text());
    Write("/usr/sbin/vantor", "no program");
    chmod((folder.Path() + "/usr/sbin/vantor").c_str(), 0757);
    Write("/usr/lib/nuvex/nvcli/none.json", "{\"commands\": []}");
    chmod((folder.Path() + "/usr/lib/nuvex/nvcli").c_str(), 0775);
    Read();
    EXPECT_EQ(Found("writable").size(), 2U);
}

TEST_F(DirectoryReaderTest, CommandsThatNobodyKnowsAreTold) {
    Write("/usr/lib/nuvex/nvcli/none.json", "{\"commands\": []}");
    DocumentText document;
    document.operations["start"] = "[\"do it\"]";
    WritePlugin("a.json", document.Text());
    EXPECT_THAT(Read(), ElementsAre("a"));
    EXPECT_EQ(Found("unknown-command").size(), 1U);
}

}  // namespace

}  // namespace vantor::analyze
