// Where the dynamic linker of a host looks for libraries.

#include "image/LibrarySearch.h"

#include <elf.h>
#include <gmock/gmock.h>

#include "analyze/image/ElfBuilder.h"
#include "analyze/image/HostFixture.h"

namespace vantor::analyze {

namespace {

using support::ElfBuilder;
using ::testing::ElementsAre;
using ::testing::IsEmpty;

// A cache as ldconfig(8) writes it: pairs of a name and a path.
std::string CacheOf(const std::vector<std::pair<std::string, std::string>>& entries) {
    std::string cache = "glibc-ld.so.cache1.1";
    cache.resize(48 + 24 * entries.size());
    ElfBuilder::Put(cache, 20, entries.size(), 4);
    std::size_t entry = 48;
    for (const auto& [name, path] : entries) {
        ElfBuilder::Put(cache, entry + 4, cache.size(), 4);
        cache += name + '\0';
        ElfBuilder::Put(cache, entry + 8, cache.size(), 4);
        cache += path + '\0';
        entry += 24;
    }
    return cache;
}

class LibrarySearchTest : public support::HostFixture {
protected:
    void WriteLibrary(const std::string& place, const Architecture& kind = support::x86) const {
        Write(place, ElfBuilder(kind).Finish());
    }
    std::string Find(const std::string& name) const {
        return LibrarySearch(image, support::x86).Find(name, Chain());
    }
    // The object, loaded for a library, which was loaded for a plugin.
    std::vector<Requirer> Chain() const {
        return {{&path, &linkage}, {&loaderPath, &loader}, {&pluginPath, &plugin}};
    }

    const std::string path = "/opt/p/x.so", loaderPath = "/opt/l/l.so", pluginPath = "/opt/q/q.so";
    Linkage linkage, loader, plugin;
};

TEST_F(LibrarySearchTest, ALibraryThatIsNowhereIsNotFound) { EXPECT_EQ(Find("libx.so"), ""); }

TEST_F(LibrarySearchTest, TheCacheComesBeforeTheDefaultFolders) {
    WriteLibrary("/usr/lib/libx.so");
    EXPECT_EQ(Find("libx.so"), "/usr/lib/libx.so");
    WriteLibrary("/lib/i386-linux-gnu/libx.so");
    EXPECT_EQ(Find("libx.so"), "/lib/i386-linux-gnu/libx.so");
    WriteLibrary("/opt/lib/libx.so");
    Write(LinkerCache::path, CacheOf({{"liby.so", "/y"}, {"libx.so", "/opt/lib/libx.so"}}));
    EXPECT_EQ(Find("libx.so"), "/opt/lib/libx.so");
}

TEST_F(LibrarySearchTest, LibrariesOfOtherArchitecturesArePassedOver) {
    WriteLibrary("/a/libx.so", support::x86With64Bits);
    WriteLibrary("/b/libx.so");
    Write(LinkerCache::path, CacheOf({{"libx.so", "/a/libx.so"}, {"libx.so", "/b/libx.so"}}));
    EXPECT_EQ(Find("libx.so"), "/b/libx.so");
}

TEST_F(LibrarySearchTest, AnObjectsOwnFoldersComeFirst) {
    WriteLibrary("/usr/lib/libx.so");
    WriteLibrary("/opt/p/lib/libx.so");
    linkage.runPath = "/none::$ORIGIN/lib";
    EXPECT_EQ(Find("libx.so"), "/opt/p/lib/libx.so");
    linkage.runPath = "${ORIGIN}/../p/$LIB";
    WriteLibrary("/opt/p/lib/i386-linux-gnu/libx.so");
    EXPECT_EQ(Find("libx.so"), "/opt/p/../p/lib/i386-linux-gnu/libx.so");
}

TEST_F(LibrarySearchTest, TheFoldersOfThoseItWasLoadedForHoldWhereAnObjectNamesNone) {
    WriteLibrary("/opt/q/libx.so");
    plugin.inheritedPath = "$ORIGIN";
    EXPECT_EQ(Find("libx.so"), "/opt/q/libx.so");
    WriteLibrary("/opt/l/libx.so");
    loader.inheritedPath = "$ORIGIN";
    EXPECT_EQ(Find("libx.so"), "/opt/l/libx.so");
    linkage.runPath = "/none";
    EXPECT_EQ(Find("libx.so"), "");
}

TEST_F(LibrarySearchTest, TheFoldersThatALoaderNamesForItselfAloneAreNotHandedOn) {
    WriteLibrary("/opt/l/libx.so");
    loader.runPath = "$ORIGIN";
    EXPECT_EQ(Find("libx.so"), "");
}

TEST_F(LibrarySearchTest, TheProgramsFoldersComeBehindThem) {
    WriteLibrary("/usr/lib/libx.so");
    WriteLibrary("/opt/bin/libx.so");
    Linkage program;
    program.inheritedPath = "$ORIGIN";
    LibrarySearch search(image, support::x86);
    search.SetProgram("/opt/bin/vantor", program);
    EXPECT_EQ(search.Find("libx.so", Chain()), "/opt/bin/libx.so");
    WriteLibrary("/opt/q/libx.so");
    plugin.inheritedPath = "/opt/q";
    EXPECT_EQ(search.Find("libx.so", Chain()), "/opt/q/libx.so");
    linkage.runPath = "/none";
    EXPECT_EQ(search.Find("libx.so", Chain()), "/usr/lib/libx.so");
}

TEST_F(LibrarySearchTest, LibrariesForNewerProcessorsWillDo) {
    const std::string path64 = "/usr/lib/x86_64-linux-gnu/glibc-hwcaps/x86-64-v2/libx.so";
    WriteLibrary(path64, support::x86With64Bits);
    EXPECT_EQ(LibrarySearch(image, support::x86With64Bits).Find("libx.so", Chain()), path64);
    EXPECT_EQ(Find("libx.so"), "");
}

TEST_F(LibrarySearchTest, AnObjectMayForbidTheDefaultFolders) {
    WriteLibrary("/usr/lib/libx.so");
    linkage.searchesDefaultFolders = false;
    EXPECT_EQ(Find("libx.so"), "");
}

TEST_F(LibrarySearchTest, APathIsTakenAsItIs) {
    WriteLibrary("/opt/libx.so");
    WriteLibrary(path);
    EXPECT_EQ(Find("/opt/libx.so"), "/opt/libx.so");
    EXPECT_EQ(Find("/opt/liby.so"), "");
    EXPECT_EQ(Find("$ORIGIN/../libx.so"), "/opt/p/../libx.so");
    EXPECT_EQ(Find("opt/libx.so"), "/opt/libx.so");
}

TEST(LinkerCacheTest, EntriesKeepTheirOrder) {
    const LinkerCache cache(CacheOf({{"x", "/2"}, {"y", "/3"}, {"x", "/1"}}), ELFDATA2LSB);
    EXPECT_THAT(cache.Find("x"), ElementsAre("/2", "/1"));
    EXPECT_THAT(cache.Find("z"), IsEmpty());
}

TEST(LinkerCacheTest, EntriesForSingleProcessorsComeBehindTheOthers) {
    std::string cache = CacheOf({{"x", "/1"}, {"x", "/2"}});
    ElfBuilder::Put(cache, 48 + 16, 1ULL << 62U, 8);
    EXPECT_THAT(LinkerCache(cache, ELFDATA2LSB).Find("x"), ElementsAre("/2", "/1"));
}

TEST(LinkerCacheTest, ATableOfTheOlderKindMayStandBeforeIt) {
    const std::string cache = "ld.so-1.7.0" + std::string(21, '\0') + CacheOf({{"x", "/1"}});
    EXPECT_THAT(LinkerCache(cache, ELFDATA2LSB).Find("x"), ElementsAre("/1"));
    EXPECT_THAT(LinkerCache("x" + cache, ELFDATA2LSB).Find("x"), IsEmpty());
}

TEST(LinkerCacheTest, EveryTruncatedCacheIsReadAsFarAsItGoes) {
    const std::string whole = CacheOf({{"x", "/1"}, {"y", "/2"}});
    for (std::size_t size = 0; size < whole.size(); ++size) {
        const LinkerCache cache(whole.substr(0, size), ELFDATA2LSB);
        EXPECT_THAT(cache.Find("y"), ::testing::AnyOf(IsEmpty(), ElementsAre("")));
    }
}

TEST(LinkerCacheTest, ACountBeyondTheFileEndsWithTheFile) {
    std::string cache = CacheOf({{"x", "/1"}});
    ElfBuilder::Put(cache, 20, 0xffffffffU, 4);
    EXPECT_THAT(LinkerCache(cache, ELFDATA2LSB).Find("x"), ElementsAre("/1"));
}

}  // namespace

}  // namespace vantor::analyze
