#include "fuzz/PlainDocument.h"

#include <cmath>
#include <list>
#include <set>

namespace vantor::support {

namespace {

const JsonValue& Member(const JsonValue& value, const std::string& key) {
    static const JsonValue none;
    const JsonValue* const member = value.Find(key);
    return member == nullptr ? none : *member;
}

double Version(const JsonValue& root) {
    return std::trunc(Member(Member(root, "metadata"), "version").number);
}

bool AllStrings(const JsonValue& list) {
    for (const JsonValue& element : list.elements) {
        if (element.kind != JsonKind::String) {
            return false;
        }
    }
    return true;
}

std::string ReasonOfNames(const JsonValue& metadata, const std::string& key) {
    const JsonValue& names = Member(metadata, key);
    if (names.kind != JsonKind::Array) {
        return "metadata is corrupt (unable to parse " + key + ")";
    }
    return AllStrings(names) ? "" : key + " tag is not a string";
}

std::string ReasonOfMetadata(const JsonValue& metadata) {
    if (metadata.kind != JsonKind::Object) {
        return "invalid metadata interface";
    }
    if (Member(metadata, "version").kind != JsonKind::Number) {
        return "metadata is corrupt (unable to parse version)";
    }
    const double version = std::trunc(Member(metadata, "version").number);
    if (!(version >= 1 && version <= 4)) {
        return "Unsupported API version";
    }
    std::vector<std::string> lists = {"provides", "requires"};
    for (const std::string flags : {"required_flags", "disabling_flags"}) {
        if (version >= 3 && metadata.Find(flags) != nullptr) {
            lists.push_back(flags);
        }
    }
    for (const std::string& list : lists) {
        const std::string reason = ReasonOfNames(metadata, list);
        if (!reason.empty()) {
            return reason;
        }
    }
    if (version >= 3 && Member(metadata, "run_once").kind != JsonKind::Boolean) {
        return "metadata is corrupt (unable to parse run_once)";
    }
    if (version >= 3 && Member(metadata, "plugin_version").kind != JsonKind::String) {
        return "metadata is corrupt (unable to parse plugin_version)";
    }
    return "";
}

std::string ReasonOfCommands(const JsonValue& commands, const std::string& spelling) {
    if (commands.kind != JsonKind::Array) {
        return "operations is corrupt (unable to parse " + spelling + ")";
    }
    return AllStrings(commands) ? "" : "command is not a string";
}

std::string ReasonOfOperations(const JsonValue& operations, double version) {
    if (operations.kind != JsonKind::Object) {
        return "invalid operations interface";
    }
    const std::string reason = ReasonOfCommands(Member(operations, "start"), "start");
    if (!reason.empty() || version < 2 || operations.Find("apply_host_profile") == nullptr) {
        return reason;
    }
    return ReasonOfCommands(Member(operations, "apply_host_profile"), "apply-host-profile");
}

std::list<std::string> Texts(const JsonValue& list) {
    std::list<std::string> texts;
    for (const JsonValue& element : list.elements) {
        texts.push_back(element.text);
    }
    return texts;
}

std::set<std::string> TextSet(const JsonValue& list) {
    const std::list<std::string> texts = Texts(list);
    return {texts.begin(), texts.end()};
}

std::list<std::string> Names(const Node::Edges& nodes) {
    std::list<std::string> names;
    for (const Node* node : nodes) {
        names.push_back(node->Name());
    }
    return names;
}

}  // namespace

std::string RejectionReason(const JsonValue& root) {
    if (root.kind != JsonKind::Object) {
        return "plugin root is not an object";
    }
    const std::string reason = ReasonOfMetadata(Member(root, "metadata"));
    return reason.empty() ? ReasonOfOperations(Member(root, "operations"), Version(root)) : reason;
}

std::string CompareWithDocument(const JSONPlugin& plugin, const JsonValue& root) {
    const JsonValue& metadata = Member(root, "metadata");
    const JsonValue& operations = Member(root, "operations");
    const double version = Version(root);
    const JsonValue none;
    const auto from = [&](double first, const JsonValue& value) -> const JsonValue& {
        return version >= first ? value : none;
    };
    const struct {
        const char* what;
        bool same;
    } comparisons[] = {
        {"version", plugin.ApiVersion() == version},
        {"provides", Names(plugin.Dependents()) == Texts(Member(metadata, "provides"))},
        {"requires", Names(plugin.Dependencies()) == Texts(Member(metadata, "requires"))},
        {"required_flags",
         plugin.RequiredFlags() == TextSet(from(3, Member(metadata, "required_flags")))},
        {"disabling_flags",
         plugin.DisablingFlags() == TextSet(from(3, Member(metadata, "disabling_flags")))},
        {"run_once", plugin.RunOnce() == from(3, Member(metadata, "run_once")).flag},
        {"plugin_version",
         plugin.PluginVersion() == from(3, Member(metadata, "plugin_version")).text},
        {"start", plugin.StartCommands() == Texts(Member(operations, "start"))},
        {"apply_host_profile", plugin.ApplyHostProfileCommands() ==
                                   Texts(from(2, Member(operations, "apply_host_profile")))},
    };
    for (const auto& comparison : comparisons) {
        if (!comparison.same) {
            return comparison.what;
        }
    }
    return "";
}

std::vector<std::string> BarriersOf(const JsonValue& root) {
    std::vector<std::string> barriers;
    for (const std::string key : {"provides", "requires"}) {
        const JsonValue& names = Member(Member(root, "metadata"), key);
        if (names.kind == JsonKind::Array && AllStrings(names)) {
            const std::list<std::string> texts = Texts(names);
            barriers.insert(barriers.end(), texts.begin(), texts.end());
        }
    }
    return barriers;
}

}  // namespace vantor::support
