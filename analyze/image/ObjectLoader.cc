#include "image/ObjectLoader.h"

#include <system_error>
#include <utility>

#include "image/ImageFile.h"

namespace vantor::analyze {

ObjectLoader::ObjectLoader(const HostImage& hostImage, const Architecture& bootArchitecture)
    : image(hostImage), search(hostImage, bootArchitecture) {}

ObjectPointer ObjectLoader::Load(const std::string& path) {
    const auto known = objects.find(path);
    if (known != objects.end()) {
        return known->second;
    }
    ObjectPointer object;
    const ImageFile file = ReadImageFile(image, path);
    if (file.kind == ImageFile::Kind::Unreadable) {
        object = std::make_shared<const Object>(
            Object{path, {}, std::generic_category().message(file.error)});
    } else {
        try {
            const ElfFile elf(file.content);
            object = std::make_shared<const Object>(Object{path, Linkage(SharedObject(elf)), {}});
        } catch (const ElfError&) {
            // To the linker too it is none.
        }
    }
    objects.emplace(path, object);
    return object;
}

Closure ObjectLoader::Close(const ObjectPointer& root, const Source& instead) {
    struct Loaded {
        ObjectPointer object;
        std::size_t loader;  // its place in the list; the root is its own
    };
    Closure closure;
    std::set<std::string> names = loadedNames;
    std::vector<Loaded> loaded{{root, 0}};
    const auto find = [&](const std::string& name, std::size_t requirer) {
        std::vector<Requirer> chain;
        for (std::size_t at = requirer;; at = loaded[at].loader) {
            chain.push_back({&loaded[at].object->path, &loaded[at].object->linkage});
            if (at == 0) {
                break;
            }
        }
        const std::string path = search.Find(name, chain);
        const ObjectPointer object = path.empty() ? nullptr : Load(path);
        return object == nullptr && instead ? instead(name) : object;
    };
    for (std::size_t at = 0; at < loaded.size(); ++at) {
        const ObjectPointer requirer = loaded[at].object;
        for (const std::string& name : requirer->linkage.needed) {
            if (!names.insert(name).second) {
                continue;
            }
            const ObjectPointer library = find(name, at);
            if (library == nullptr) {
                closure.missing.push_back(name);
                continue;
            }
            const std::string& soname = library->linkage.soname;
            if (soname.empty() || soname == name || names.insert(soname).second) {
                closure.libraries.push_back(library);
                loaded.push_back({library, at});
            }
        }
    }
    return closure;
}

void ObjectLoader::SetLoaded(const std::vector<ObjectPointer>& loaded) {
    for (const ObjectPointer& object : loaded) {
        loadedNames.insert(object->path.substr(object->path.find_last_of('/') + 1));
        loadedNames.insert(object->linkage.soname);
        loadedNames.insert(object->linkage.needed.begin(), object->linkage.needed.end());
    }
}

std::vector<std::string> ObjectLoader::Paths() const {
    std::vector<std::string> paths;
    for (const auto& [path, object] : objects) {
        if (object != nullptr) {
            paths.push_back(path);
        }
    }
    return paths;
}

}  // namespace vantor::analyze
