#include "image/SharedNames.h"

#include <cstddef>
#include <unordered_map>

namespace vantor::analyze {

namespace {

using Exporters = std::vector<std::size_t>;  // objects, ascending

constexpr std::size_t mostNamed = 3;  // exporters in one sentence

}  // namespace

void SharedNames::Add(const NativeReading& reading) {
    objects.push_back({reading.plugin.place, reading.sharedParts, reading.exports});
}

void SharedNames::Report(Findings& findings) const {
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
    for (std::size_t i = 0; i < objects.size(); ++i) {
        for (const SharedPart& part : objects[i].parts) {
            std::string others;
            std::size_t count = 0;
            const Exporters& all = exporters[part.symbol];
            // Beyond those that are named the number is enough: no list grows with the directory.
            for (std::size_t at = 0; at < all.size() && count < mostNamed; ++at) {
                if (all[at] != i) {
                    others += (count == 0 ? "" : ", ") + objects[all[at]].place.path;
                    ++count;
                }
            }
            if (count == 0) {
                continue;
            }
            const std::size_t unnamed = all.size() - 1 - count;
            if (unnamed > 0) {
                others += " and " + std::to_string(unnamed) + " more";
            }
            findings.push_back({Severity::Error, "taken-over", objects[i].place,
                                part.what + " is looked up by its exported name \"" + part.symbol +
                                    "\", which is exported by " + others +
                                    " too: whichever is loaded first serves all of them"});
        }
    }
}

}  // namespace vantor::analyze
