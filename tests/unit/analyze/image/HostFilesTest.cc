// Debug entries, commands and the ownership of files: what else a host's folders tell.

#include <fcntl.h>
#include <gmock/gmock.h>
#include <sys/stat.h>
#include <unistd.h>

#include "analyze/image/HostFixture.h"
#include "image/CommandDescriptions.h"
#include "image/DebugDescription.h"
#include "image/ImageFile.h"
#include "image/Ownership.h"
#include "image/ReadFiles.h"

namespace vantor::analyze {

namespace {

using ::testing::ElementsAre;
using ::testing::IsEmpty;

class DebugDescriptionTest : public support::HostFixture {};

TEST_F(DebugDescriptionTest, EveryEntryIsAPluginOfItsLine) {
    Write(HostImage::debugConfiguration, "\nlook:a,b:c:cat /x\n\nlast:z: :true\n");
    const std::vector<PluginDescription> plugins =
        DebugDescription(image, findings).OfConfiguration(findings);
    EXPECT_THAT(Found(), IsEmpty());
    ASSERT_EQ(plugins.size(), 2U);
    EXPECT_EQ(plugins[0].name, "look");
    EXPECT_EQ(plugins[0].kind, PluginKind::Debug);
    EXPECT_EQ(plugins[0].apiVersion, 1);
    EXPECT_EQ(plugins[0].place.path, "/etc/nuvex/vantor/debug.conf");
    EXPECT_EQ(plugins[0].place.line, 2);
    ASSERT_EQ(plugins[0].required.size(), 2U);
    EXPECT_EQ(plugins[0].required[1].name, "b");
    EXPECT_EQ(plugins[0].required[1].place.line, 2);
    EXPECT_EQ(plugins[0].provided.at(0).name, "c");
    EXPECT_EQ(plugins[1].place.line, 4);
}

TEST_F(DebugDescriptionTest, AMalformedEntryIsToldInTheBootsWords) {
    Write(HostImage::debugConfiguration, "a:b:c:d\n  x:a:b \n");
    EXPECT_EQ(DebugDescription(image, findings).OfConfiguration(findings).size(), 1U);
    EXPECT_THAT(Found(), ElementsAre("/etc/nuvex/vantor/debug.conf:2 warning malformed-entry: "
                                     "ignoring malformed debug entry at line 2: x:a:b"));
}

TEST_F(DebugDescriptionTest, AConfigurationThatIsNoFileIsTold) {
    boost::filesystem::create_directories(folder.Path() + "/etc/nuvex/vantor/debug.conf");
    DebugDescription(image, findings);
    boost::filesystem::remove(folder.Path() + "/etc/nuvex/vantor/debug.conf");
    ASSERT_EQ(mkfifo(folder.File("etc/nuvex/vantor/debug.conf").c_str(), 0600), 0);
    DebugDescription(image, findings);
    EXPECT_THAT(Found(), ElementsAre("/etc/nuvex/vantor/debug.conf:0 warning unreadable: is a "
                                     "folder: the boot finds no entry in it",
                                     "/etc/nuvex/vantor/debug.conf:0 error unreadable: is no "
                                     "regular file: the boot may wait for it for ever"));
}

TEST_F(DebugDescriptionTest, WithoutAConfigurationThereAreNone) {
    EXPECT_THAT(DebugDescription(image, findings).OfConfiguration(findings), IsEmpty());
    EXPECT_THAT(Found(), IsEmpty());
}

TEST_F(DebugDescriptionTest, AMarkerWithoutAnEntryIsTold) {
    DebugDescription debug(image, findings);
    EXPECT_THAT(debug.OfMarker("x", {"/p/x.debug", 0, 0}, findings), IsEmpty());
    EXPECT_THAT(Found(), ElementsAre("/p/x.debug:0 warning marker-without-entry: no entry of "
                                     "/etc/nuvex/vantor/debug.conf has the name \"x\""));
}

TEST_F(DebugDescriptionTest, AnEntryThatAMarkerBringsTooRunsTwice) {
    Write(HostImage::debugConfiguration, "x:a:b:c\ny:a:b:c\nx:d:e:f\n");
    DebugDescription debug(image, findings);
    const auto marked = debug.OfMarker("x", {"/p/x.debug", 0, 0}, findings);
    ASSERT_EQ(marked.size(), 2U);
    EXPECT_EQ(marked[1].place.line, 3);
    debug.OfMarker("y", {"/p/liby.debug", 0, 0}, findings);
    debug.OfMarker("y", {"/p/y.debug", 0, 0}, findings);
    EXPECT_EQ(debug.OfConfiguration(findings).size(), 3U);
    EXPECT_THAT(Found(),
                ElementsAre("/etc/nuvex/vantor/debug.conf:1 warning entry-twice: the entry \"x\" "
                            "runs twice: for itself and for the marker /p/x.debug",
                            "/etc/nuvex/vantor/debug.conf:2 warning entry-twice: the entry \"y\" "
                            "runs 3 times: for itself and for the marker /p/liby.debug, /p/y.debug",
                            "/etc/nuvex/vantor/debug.conf:3 warning entry-twice: the entry \"x\" "
                            "runs twice: for itself and for the marker /p/x.debug"));
}

class CommandDescriptionsTest : public support::HostFixture {
protected:
    CommandDescriptionsTest() { chmod(folder.Path().c_str(), 0755); }

    void Describe() const {
        Write("/usr/lib/nuvex/nvcli/int/ext/system.json",
              R"({"commands": [{"path": "system folder create", "summary": "s",
                  "options": [{"name": "path", "kind": "string", "required": true,
                               "summary": "s"}],
                  "execute": ["/bin/mkdir", "${path}"]}]})");
    }
    std::vector<std::string> Check(const std::string& text) {
        Ownership ownership(image);
        CommandDescriptions(image, ownership, findings)
            .Check({text, {"/p/x.json", 3, 5}}, findings);
        return Found();
    }
};

TEST_F(CommandDescriptionsTest, AKnownCommandPasses) {
    Describe();
    EXPECT_THAT(Check("system folder create --path='/a b'"), IsEmpty());
    EXPECT_THAT(Check("system folder --help"), IsEmpty());
    EXPECT_THAT(Check(""), IsEmpty());
}

TEST_F(CommandDescriptionsTest, AnUnknownCommandIsToldInTheBootsWords) {
    Describe();
    EXPECT_THAT(Check("system folder creat --path=/a"),
                ElementsAre("/p/x.json:3 warning unknown-command: \"system folder creat "
                            "--path=/a\": unknown command \"system folder creat\"; the nearest "
                            "known one is \"system folder create\""));
}

TEST_F(CommandDescriptionsTest, ACommandWithBadOptionsIsTold) {
    Describe();
    EXPECT_THAT(Check("system folder create"),
                ElementsAre("/p/x.json:3 warning bad-command: \"system folder create\": the "
                            "command \"system folder create\" needs the option \"--path\""));
}

TEST_F(CommandDescriptionsTest, ACommandLineThatCannotBeParsedIsTold) {
    Describe();
    const std::vector<std::string> found = Check("system 'open");
    ASSERT_EQ(found.size(), 1U);
    EXPECT_EQ(found[0].rfind("/p/x.json:3 warning bad-command: \"system 'open\": ", 0), 0U);
}

TEST_F(CommandDescriptionsTest, ThatThereAreNoDescriptionsIsToldOnceAndNotOfEachCommand) {
    EXPECT_THAT(Check("system folder creat"), IsEmpty());
    BootModel model;
    Ownership ownership(image);
    const CommandDescriptions none(image, ownership, findings);
    none.CheckFolders(model, findings);
    EXPECT_THAT(Found(), IsEmpty()) << "nobody has a command";
    model.plugins.emplace_back().commands = {{"a", {}}, {"b", {}}};
    none.CheckFolders(model, findings);
    EXPECT_THAT(Found(), ElementsAre("/usr/lib/nuvex/nvcli:0 warning no-descriptions: there are "
                                     "no command descriptions here: no command of a JSON plugin "
                                     "is known"));
}

TEST_F(CommandDescriptionsTest, ABadDescriptionIsToldByItsPathOnTheHost) {
    Write("/usr/lib/nuvex/nvcli/x.json", "{}");
    Write("/usr/lib/nuvex/nvcli/ext/y.json", "{\"commands\": []");
    ASSERT_EQ(symlink("nowhere", folder.File("usr/lib/nuvex/nvcli/z.json").c_str()), 0);
    Check("");
    const std::vector<std::string> found = Found("bad-description");
    ASSERT_EQ(found.size(), 3U);
    EXPECT_EQ(found[0], "/usr/lib/nuvex/nvcli/x.json:0 warning bad-description: the key "
                        "\"commands\" is missing");
    EXPECT_EQ(found[1], "/usr/lib/nuvex/nvcli/z.json:0 warning bad-description: cannot read the "
                        "file: No such file or directory");
    EXPECT_EQ(found[2].rfind("/usr/lib/nuvex/nvcli/ext/y.json:0 warning bad-description: ", 0), 0U)
        << found[2];
}

TEST_F(CommandDescriptionsTest, DescriptionsAreReadWhereTheirLinksLeadOnTheHost) {
    Describe();
    boost::filesystem::rename(folder.Path() + "/usr/lib/nuvex/nvcli", folder.Path() + "/moved");
    ASSERT_EQ(symlink("/moved", folder.File("usr/lib/nuvex/nvcli").c_str()), 0);
    EXPECT_THAT(Check("system folder create --path=/a"), IsEmpty());
    EXPECT_EQ(Check("system folder creat").size(), 1U);
}

TEST_F(CommandDescriptionsTest, DescriptionsThatOthersMayWriteAreTold) {
    Write("/usr/lib/nuvex/nvcli/x.json", "{\"commands\": []}");
    chmod(folder.File("usr/lib/nuvex/nvcli/x.json").c_str(), 0666);
    Check("");
    EXPECT_EQ(Found("writable"),
              std::vector<std::string>{
                  "/usr/lib/nuvex/nvcli/x.json:0 warning writable: can be written by others than "
                  "root: its group, " +
                  std::to_string(getegid()) + ", everybody (mode 0666)"});
}

class OwnershipTest : public support::HostFixture {
protected:
    std::vector<std::string> Check(mode_t mode, uid_t owner) {
        struct stat status {};
        status.st_mode = mode;
        status.st_uid = owner;
        status.st_gid = 7;
        Ownership(image).Check("/x", status, findings);
        return Found();
    }
};

TEST_F(OwnershipTest, WhatRootAloneMayWriteIsGood) { EXPECT_THAT(Check(0100755, 0), IsEmpty()); }

TEST_F(OwnershipTest, TheOwnerOfTheImageStandsForRoot) {
    EXPECT_THAT(Check(0100644, geteuid()), IsEmpty());
}

TEST_F(OwnershipTest, EveryoneElseWhoMayWriteIsNamed) {
    EXPECT_THAT(Check(0100666, 4711),
                ElementsAre("/x:0 warning writable: can be written by others than root: its "
                            "owner, user 4711, its group, 7, everybody (mode 0666)"));
}

TEST_F(OwnershipTest, FoldersAboveAreLookedAtOnceAndStickyOnesAreGoodEnough) {
    Write("/a/b/c/x", "");
    chmod(folder.Path().c_str(), 0755);
    chmod(folder.File("a").c_str(), 0777);
    chmod(folder.File("a/b").c_str(), 01777);
    chmod(folder.File("a/b/c").c_str(), 01777);
    Ownership ownership(image);
    ownership.CheckFoldersOf("/a/b/c/x", findings);
    ownership.CheckFoldersOf("/a/b/c/y", findings);
    EXPECT_THAT(Found(), ElementsAre("/a/b/c:0 warning writable: can be written by others than "
                                     "root: its group, " +
                                         std::to_string(getegid()) + ", everybody (mode 1777)",
                                     "/a:0 warning writable: can be written by others than root: "
                                     "its group, " +
                                         std::to_string(getegid()) + ", everybody (mode 0777)"));
}

class ImageFileTest : public support::HostFixture {};

TEST_F(ImageFileTest, AbsoluteLinksStayInTheImage) {
    Write("/opt/x", "inside");
    ASSERT_EQ(symlink("/opt/x", folder.File("link").c_str()), 0);
    struct stat own {};
    ASSERT_NE(stat("/opt/x", &own), 0) << "this machine must not have the file";
    const ImageFile file = ReadImageFile(image, "/link");
    EXPECT_EQ(file.kind, ImageFile::Kind::Regular);
    EXPECT_EQ(file.content, "inside");
}

TEST_F(ImageFileTest, ALinkLeadsWhereItLeadsOnTheHost) {
    Write("/opt/real/x", "");
    ASSERT_EQ(symlink("/opt/./real", folder.File("link").c_str()), 0);
    ASSERT_EQ(symlink("../../link/x", folder.File("opt/up").c_str()), 0);
    ASSERT_EQ(symlink("self", folder.File("self").c_str()), 0);
    EXPECT_EQ(ResolveInImage(image, "/opt//real/../real/x"), "/opt/real/x");
    EXPECT_EQ(ResolveInImage(image, "/link/x"), "/opt/real/x");
    EXPECT_EQ(ResolveInImage(image, "/opt/up"), "/opt/real/x");
    EXPECT_EQ(ResolveInImage(image, "/link/none/y"), "/opt/real/none/y");
    EXPECT_EQ(ResolveInImage(image, "/self/x"), "/self/x");
    EXPECT_EQ(ResolveInImage(image, "/../.."), "/");
    EXPECT_EQ(ResolveInImage(image, "here"), "here");
}

TEST_F(ImageFileTest, WhatHasBeenReadIsKnownByAnyName) {
    Write("/x", "text");
    ASSERT_EQ(link(folder.File("x").c_str(), folder.File("z").c_str()), 0);
    ReadImageFile(image, "/x");
    EXPECT_TRUE(WasRead(folder.File("z")));
    EXPECT_FALSE(WasRead("/proc/self/exe"));
    EXPECT_FALSE(WasRead(folder.File("none")));
}

TEST_F(ImageFileTest, KindsAreTold) {
    ASSERT_EQ(mkfifo(folder.File("fifo").c_str(), 0600), 0);
    ASSERT_EQ(mkdir(folder.File("folder").c_str(), 0700), 0);
    EXPECT_EQ(ReadImageFile(image, "/fifo").kind, ImageFile::Kind::Irregular);
    EXPECT_EQ(ReadImageFile(image, "/folder").kind, ImageFile::Kind::Folder);
    EXPECT_EQ(ReadImageFile(image, "/none").kind, ImageFile::Kind::Missing);
    EXPECT_EQ(ReadImageFile(image, "/none").error, ENOENT);
}

TEST_F(ImageFileTest, NoMoreIsReadThanIsAskedFor) {
    Write("/x", "0123456789");
    EXPECT_EQ(ReadImageFile(image, "/x", 4).content, "0123");
}

}  // namespace

}  // namespace vantor::analyze
