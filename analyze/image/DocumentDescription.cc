#include "image/DocumentDescription.h"

#include <istream>
#include <list>
#include <sstream>

#include "image/JsonPositions.h"
#include "json/PluginDocument.h"
#include "plugins/Exceptions.h"

namespace vantor::analyze {

namespace {

// Places in one document.
class Places {
public:
    Places(const JsonPositions& documentPositions, const PluginSource& pluginSource)
        : positions(documentPositions), source(pluginSource) {}

    Place At(const JsonPositions::Position& position) const {
        return {source.place.path, position.line, position.column};
    }
    Place Of(const DocumentPlace& place) const { return At(positions.Of(place)); }
    Place Of(const char* part, const char* key, std::size_t element) const {
        return Of({{part, key}, element});
    }

private:
    const JsonPositions& positions;
    const PluginSource& source;
};

std::vector<BarrierName> Barriers(const std::list<std::string>& names, const char* key,
                                  const Places& places) {
    std::vector<BarrierName> barriers;
    for (const std::string& name : names) {
        barriers.push_back({name, places.Of("metadata", key, barriers.size())});
    }
    return barriers;
}

void AppendCommands(const std::list<std::string>& texts, const char* key, const Places& places,
                    std::vector<Command>& commands) {
    std::size_t element = 0;
    for (const std::string& text : texts) {
        commands.push_back({text, places.Of("operations", key, element)});
        ++element;
    }
}

PluginDescription Describe(const PluginDocument& document, const PluginSource& source,
                           const Places& places) {
    PluginDescription plugin;
    plugin.kind = PluginKind::Json;
    plugin.place = source.place;
    plugin.apiVersion = document.apiVersion;
    plugin.provided = Barriers(document.provided, "provides", places);
    plugin.required = Barriers(document.required, "requires", places);
    plugin.requiredFlags = document.requiredFlags;
    plugin.disablingFlags = document.disablingFlags;
    plugin.runOnce = document.runOnce;
    plugin.pluginVersion = document.pluginVersion;
    AppendCommands(document.startCommands, "start", places, plugin.commands);
    AppendCommands(document.applyHostProfileCommands, "apply_host_profile", places,
                   plugin.commands);
    return plugin;
}

std::string Invalid(const PluginSource& source, const char* reason) {
    return InvalidPluginException(source.bootPath, reason).what();
}

}  // namespace

std::optional<PluginDescription> ReadDocument(const std::string& content,
                                              const PluginSource& source, Findings& findings) {
    const JsonPositions positions(content);
    const Places places(positions, source);
    if (positions.Ending() == JsonPositions::End::LoneSlash) {
        findings.push_back({Severity::Error, "lone-slash", places.At(positions.Stop()),
                            "a \"/\" that begins no comment: the boot would read it for ever"});
        return std::nullopt;
    }
    try {
        std::istringstream stream(content);
        PluginDocument document;
        ReadPluginDocument(stream, source.bootPath, document);
        return Describe(document, source, places);
    } catch (const DocumentRejection& rejection) {
        const std::string reason = rejection.what();
        if (positions.Ending() == JsonPositions::End::TooDeep) {
            findings.push_back({Severity::Error, "deep-nesting", places.At(positions.Stop()),
                                reason + " (nested deeper than 1000 levels)"});
        } else if (positions.Ending() == JsonPositions::End::Broken) {
            findings.push_back({Severity::Error, "rejected", places.At(positions.Stop()), reason});
        } else {
            const bool unsupported = reason == Invalid(source, "Unsupported API version");
            findings.push_back({Severity::Error, unsupported ? "unsupported-version" : "rejected",
                                places.Of(rejection.Place()), reason});
        }
        return std::nullopt;
    }
}

void RejectMissingDocument(const PluginSource& source, Findings& findings) {
    findings.push_back(
        {Severity::Error, "rejected", source.place, Invalid(source, "no such file or directory")});
}

}  // namespace vantor::analyze
