#include "image/SharedNames.h"

#include <algorithm>

namespace vantor::analyze {

namespace {

constexpr std::size_t mostExporters = 3;  // exporters in one sentence

}  // namespace

void SharedNames::Add(const NativeReading& reading) {
    objects.push_back({reading.plugin.place, reading.sharedParts, reading.exports});
}

void SharedNames::Forget(const std::set<std::string>& paths) {
    objects.erase(
        std::remove_if(objects.begin(), objects.end(),
                       [&](const Object& object) { return paths.count(object.place.path) != 0; }),
        objects.end());
}

std::unordered_map<std::string, SharedNames::Exporters> SharedNames::FindExporters() const {
    std::unordered_map<std::string, Exporters> exporters;
    for (const Object& object : objects) {
        for (const SharedPart& part : object.parts) {
            exporters[part.symbol];
        }
    }
    for (std::size_t i = 0; i < objects.size(); ++i) {
        for (const std::string& name : objects[i].exports) {
            const auto wanted = exporters.find(name);
            if (wanted != exporters.end() &&
                (wanted->second.empty() || wanted->second.back() != i)) {
                wanted->second.push_back(i);
            }
        }
    }
    return exporters;
}

std::string SharedNames::Others(const Exporters& exporters, std::size_t object) const {
    std::string others;
    std::size_t count = 0;
    // Beyond those that are named the number is enough: no list grows with the directory.
    for (std::size_t at = 0; at < exporters.size() && count < mostExporters; ++at) {
        if (exporters[at] != object) {
            others += (count == 0 ? "" : ", ") + objects[exporters[at]].place.path;
            ++count;
        }
    }
    if (count > 0 && exporters.size() - 1 > count) {
        others += " and " + std::to_string(exporters.size() - 1 - count) + " more";
    }
    return others;
}

void SharedNames::Report(const LinkScope& scope, Findings& findings) const {
    const std::unordered_map<std::string, Exporters> exporters = FindExporters();
    for (std::size_t i = 0; i < objects.size(); ++i) {
        for (const SharedPart& part : objects[i].parts) {
            const std::string library = scope.Exporter(part.symbol);
            const std::string others = Others(exporters.at(part.symbol), i);
            std::string who;
            if (!library.empty()) {
                who = library + " too, which the boot program has loaded before: it serves this "
                                "plugin";
            } else if (!others.empty()) {
                who = others + " too: whichever is loaded first serves all of them";
            } else {
                continue;
            }
            findings.push_back({Severity::Error, "taken-over", objects[i].place,
                                part.what + " is looked up by its exported name \"" + part.symbol +
                                    "\", which is exported by " + who});
        }
    }
}

}  // namespace vantor::analyze
