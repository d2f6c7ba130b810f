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
    if (boot.machine == EM_X86_64) {
        for (const char* const level : {"v4", "v3", "v2"}) {
            variants.push_back(std::string("glibc-hwcaps/x86-64-") + level + "/");
        }
    }
}

void LibrarySearch::SetProgram(const std::string& path, const Linkage& linkage) {
    programPath = path;
    programFolders = linkage.inheritedPath;
}

// One that cannot be read here will do: the linker, which is root's, can.
bool LibrarySearch::IsLibrary(const std::string& path) const {
    const ImageFile file = ReadImageFile(image, path, architectureBytes);
    return file.kind == ImageFile::Kind::Unreadable ||
           (file.kind == ImageFile::Kind::Regular && ArchitectureOf(file.content) == boot);
}

std::string LibrarySearch::Expand(const std::string& text, const std::string& objectPath) const {
    std::string expanded = text;
    const std::string origin = objectPath.substr(0, objectPath.find_last_of('/'));
    for (const char* const spelling : {"$ORIGIN", "${ORIGIN}"}) {
        ReplaceAll(expanded, spelling, origin);
    }
    for (const char* const spelling : {"$LIB", "${LIB}"}) {
        ReplaceAll(expanded, spelling, libraryFolder);
    }
    return expanded;
}

std::string LibrarySearch::FindIn(const std::string& folders, const std::string& name,
                                  const std::string& objectPath) const {
    std::istringstream rest(Expand(folders, objectPath));
    for (std::string folder; std::getline(rest, folder, ':');) {
        if (folder.empty()) {
            continue;
        }
        folder += '/';
        if (IsLibrary(folder + name)) {
            return folder + name;
        }
        for (const std::string& variant : variants) {
            std::string path = folder;
            path.append(variant).append(name);
            if (IsLibrary(path)) {
                return path;
            }
        }
    }
    return {};
}

// An object that names folders for itself alone asks nobody else; such a one also hands none on.
std::string LibrarySearch::FindAlongChain(const std::string& name,
                                          const std::vector<Requirer>& chain) const {
    const Requirer& first = chain.front();
    if (!first.linkage->runPath.empty()) {
        return FindIn(first.linkage->runPath, name, *first.path);
    }
    for (const Requirer& one : chain) {
        std::string found = FindIn(one.linkage->inheritedPath, name, *one.path);
        if (!found.empty()) {
            return found;
        }
    }
    return FindIn(programFolders, name, programPath);
}

std::string LibrarySearch::Find(const std::string& name, const std::vector<Requirer>& chain) const {
    const Requirer& first = chain.front();
    if (name.find('/') != std::string::npos) {
        // The boot's working folder is the host's root.
        std::string path = Expand(name, *first.path);
        if (path.front() != '/') {
            path.insert(0, "/");
        }
        return IsLibrary(path) ? path : std::string();
    }
    std::string found = FindAlongChain(name, chain);
    if (!found.empty()) {
        return found;
    }
    const std::vector<std::string>& cached = cache.Find(name);
    const auto fits = std::find_if(cached.begin(), cached.end(),
                                   [this](const std::string& one) { return IsLibrary(one); });
    if (fits != cached.end()) {
        return *fits;
    }
    return first.linkage->searchesDefaultFolders ? FindIn(defaultFolders, name, *first.path)
                                                 : std::string();
}

}  // namespace vantor::analyze
