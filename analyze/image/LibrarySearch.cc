#include "image/LibrarySearch.h"

#include <elf.h>

#include <algorithm>
#include <sstream>

#include "image/ImageFile.h"

namespace vantor::analyze {

namespace {

// The folder of one architecture's libraries below /lib and /usr/lib; empty for those that Debian
// has none of.
std::string ArchitectureFolder(const Architecture& architecture) {
    switch (architecture.machine) {
    case EM_X86_64:
        return architecture.WordSize() == 8 ? "x86_64-linux-gnu" : "x86_64-linux-gnux32";
    case EM_386:
        return "i386-linux-gnu";
    case EM_AARCH64:
        return "aarch64-linux-gnu";
    case EM_ARM:
        return "arm-linux-gnueabihf";
    default:
        return {};
    }
}

void ReplaceAll(std::string& text, const std::string& what, const std::string& with) {
    for (std::size_t at = text.find(what); at != std::string::npos;
         at = text.find(what, at + with.size())) {
        text.replace(at, what.size(), with);
    }
}

}  // namespace

LibrarySearch::LibrarySearch(const HostImage& hostImage, const Architecture& bootArchitecture)
    : image(hostImage),
      boot(bootArchitecture),
      cache(ReadImageFile(image, LinkerCache::path).content, boot.byteOrder) {
    const std::string folder = ArchitectureFolder(boot);
    defaultFolders = folder.empty() ? "/lib:/usr/lib"
                                    : "/lib/" + folder + ":/usr/lib/" + folder + ":/lib:/usr/lib";
    libraryFolder = folder.empty() ? "lib" : "lib/" + folder;
}

bool LibrarySearch::IsLibrary(const std::string& path) const {
    const ImageFile file = ReadImageFile(image, path, architectureBytes);
    return file.kind == ImageFile::Kind::Regular && ArchitectureOf(file.content) == boot;
}

std::string LibrarySearch::FindIn(const std::string& searchPath, const std::string& name,
                                  const std::string& objectPath) const {
    std::istringstream folders(searchPath);
    for (std::string folder; std::getline(folders, folder, ':');) {
        const std::string origin = objectPath.substr(0, objectPath.find_last_of('/'));
        for (const char* const spelling : {"$ORIGIN", "${ORIGIN}"}) {
            ReplaceAll(folder, spelling, origin);
        }
        for (const char* const spelling : {"$LIB", "${LIB}"}) {
            ReplaceAll(folder, spelling, libraryFolder);
        }
        if (!folder.empty() && IsLibrary(folder.append("/").append(name))) {
            return folder;
        }
    }
    return {};
}

std::string LibrarySearch::Find(const std::string& name, const std::string& path,
                                const Linkage& linkage) const {
    if (name.find('/') != std::string::npos) {
        return IsLibrary(name) ? name : std::string();
    }
    std::string found;
    if (linkage.runPath.empty()) {
        found = FindIn(linkage.inheritedPath, name, path);
        found = found.empty() ? FindIn(inherited, name, HostImage::program) : found;
    } else {
        found = FindIn(linkage.runPath, name, path);
    }
    if (!found.empty()) {
        return found;
    }
    const std::vector<std::string>& cached = cache.Find(name);
    const auto fits = std::find_if(cached.begin(), cached.end(),
                                   [this](const std::string& one) { return IsLibrary(one); });
    if (fits != cached.end()) {
        return *fits;
    }
    return linkage.searchesDefaultFolders ? FindIn(defaultFolders, name, path) : std::string();
}

}  // namespace vantor::analyze
