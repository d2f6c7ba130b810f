#include "image/DebugDescription.h"

#include <list>
#include <sstream>
#include <system_error>
#include <utility>

#include "image/ImageFile.h"

namespace vantor::analyze {

namespace {

std::vector<BarrierName> Barriers(const std::list<std::string>& names, const Place& place) {
    std::vector<BarrierName> barriers;
    for (const std::string& name : names) {
        barriers.push_back({name, place});
    }
    return barriers;
}

std::string Times(std::size_t count) {
    return count == 2 ? "twice" : std::to_string(count) + " times";
}

std::string Join(const std::vector<std::string>& texts) {
    std::string joined;
    for (const std::string& text : texts) {
        joined += (joined.empty() ? "" : ", ") + text;
    }
    return joined;
}

Place LineOf(int line) { return {HostImage::debugConfiguration, line, 0}; }

}  // namespace

DebugDescription::DebugDescription(const HostImage& image, Findings& findings) {
    const ImageFile file = ReadImageFile(image, HostImage::debugConfiguration);
    if (file.kind == ImageFile::Kind::Unreadable) {
        findings.push_back({Severity::Warning, "unreadable", LineOf(0),
                            "cannot be read: " + std::generic_category().message(file.error)});
    }
    if (file.kind == ImageFile::Kind::Irregular) {
        findings.push_back({Severity::Error, "unreadable", LineOf(0),
                            "is no regular file: the boot may wait for it for ever"});
    } else if (file.kind == ImageFile::Kind::Folder) {
        findings.push_back({Severity::Warning, "unreadable", LineOf(0),
                            "is a folder: the boot finds no entry in it"});
    }
    std::istringstream stream(file.content);
    const auto report = [&findings](int line, const std::string& text) {
        findings.push_back({Severity::Warning, "malformed-entry", LineOf(line), text});
    };
    for (DebugEntry& entry : ParseDebugConfig(stream, report)) {
        byName[entry.name].push_back(entries.size());
        entries.push_back({std::move(entry), {}});
    }
}

PluginDescription DebugDescription::Describe(const DebugEntry& entry) {
    PluginDescription plugin;
    plugin.name = entry.name;
    plugin.kind = PluginKind::Debug;
    plugin.place = LineOf(entry.line);
    plugin.apiVersion = 1;
    plugin.provided = Barriers(entry.providedBarriers, plugin.place);
    plugin.required = Barriers(entry.requiredBarriers, plugin.place);
    return plugin;
}

std::vector<PluginDescription> DebugDescription::OfMarker(const std::string& name,
                                                          const Place& marker, Findings& findings) {
    std::vector<PluginDescription> plugins;
    const auto named = byName.find(name);
    if (named == byName.end()) {
        findings.push_back({Severity::Warning, "marker-without-entry", marker,
                            "no entry of " + std::string(HostImage::debugConfiguration) +
                                " has the name \"" + name + "\""});
        return plugins;
    }
    for (const std::size_t index : named->second) {
        entries[index].markers.push_back(marker.path);
        plugins.push_back(Describe(entries[index].entry));
    }
    return plugins;
}

std::vector<PluginDescription> DebugDescription::OfConfiguration(Findings& findings) const {
    std::vector<PluginDescription> plugins;
    for (const Entry& one : entries) {
        plugins.push_back(Describe(one.entry));
        if (!one.markers.empty()) {
            findings.push_back({Severity::Warning, "entry-twice", plugins.back().place,
                                "the entry \"" + one.entry.name + "\" runs " +
                                    Times(1 + one.markers.size()) +
                                    ": for itself and for the marker " + Join(one.markers)});
        }
    }
    return plugins;
}

}  // namespace vantor::analyze
