#include "verify/Wording.h"

namespace vantor::analyze {

std::string Quoted(const PluginDescription& plugin) { return "'" + plugin.name + "'"; }

std::string QuotedBarrier(const std::string& name) { return '"' + name + '"'; }

std::string Enumerate(const std::vector<std::string>& phrases) {
    std::string text;
    for (std::size_t i = 0; i < phrases.size(); ++i) {
        text += i == 0 ? "" : i + 1 == phrases.size() ? " and " : ", ";
        text += phrases[i];
    }
    return text;
}

std::string Enumerate(const BootModel& model, const std::vector<std::size_t>& plugins) {
    std::vector<std::string> names;
    names.reserve(plugins.size());
    for (const std::size_t plugin : plugins) {
        names.push_back(Quoted(model.plugins[plugin]));
    }
    return Enumerate(names);
}

std::string Counted(std::size_t number, const std::string& noun) {
    return std::to_string(number) + " " + noun + (number == 1 ? "" : "s");
}

std::string Spelled(const Place& place) {
    std::string text = place.path;
    if (place.line > 0) {
        text += ":" + std::to_string(place.line);
        if (place.column > 0) {
            text += ":" + std::to_string(place.column);
        }
    }
    return text;
}

Place PlaceOf(const PluginDescription& plugin, const std::vector<BarrierName>& list,
              const std::string& barrier) {
    for (const BarrierName& entry : list) {
        if (entry.name == barrier && entry.place.line > 0) {
            return entry.place;
        }
    }
    return plugin.place;
}

std::string Reason(const PluginDescription& plugin) {
    std::string reason = plugin.fateReason;
    while (!reason.empty() && reason.back() == ' ') {
        reason.pop_back();
    }
    return reason;
}

std::string OnOneLine(const std::string& text) {
    constexpr const char* digits = "0123456789abcdef";
    std::string line;
    line.reserve(text.size());
    for (const char c : text) {
        const auto byte = static_cast<unsigned char>(c);
        if (byte < 0x20 || byte == 0x7f) {
            line += {'\\', 'x', digits[byte / 16], digits[byte % 16]};
        } else {
            line += c;
        }
    }
    return line;
}

}  // namespace vantor::analyze
