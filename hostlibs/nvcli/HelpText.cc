#include "nvcli/HelpText.h"

#include <algorithm>
#include <utility>
#include <vector>

namespace nvcli {

namespace {

using BaseKit::AutoCli::CommandDescription;
using BaseKit::AutoCli::CommandNamespace;
using BaseKit::AutoCli::CommandOption;
using BaseKit::AutoCli::CommandPointer;
using BaseKit::AutoCli::ValueKind;

using Rows = std::vector<std::pair<std::string, std::string>>;

std::string Join(const std::vector<std::string>& words, const char* separator) {
    std::string joined;
    for (const std::string& word : words) {
        joined += (joined.empty() ? "" : separator) + word;
    }
    return joined;
}

std::size_t WidthOf(const Rows& rows) {
    std::size_t width = 0;
    for (const auto& [left, right] : rows) {
        width = std::max(width, left.size());
    }
    return width;
}

// Two columns, the left one `width` characters wide. Nothing stands behind the last word of a line.
std::string Table(const Rows& rows, std::size_t width) {
    std::string table;
    for (const auto& [left, right] : rows) {
        table += "  " + left;
        if (!right.empty()) {
            table += std::string(width - left.size() + 2, ' ') + right;
        }
        table += '\n';
    }
    return table;
}

struct Section {
    std::string title;
    Rows rows;
};

// The namespaces that hold commands, each before those within it.
void CollectSections(const CommandNamespace& space, std::vector<Section>& sections) {
    if (!space.commands.empty()) {
        Section section{Join(space.path, " "), {}};
        for (const CommandPointer& command : space.commands) {
            section.rows.emplace_back(command->path.back(), command->summary);
        }
        sections.push_back(std::move(section));
    }
    for (const auto& inner : space.namespaces) {
        CollectSections(*inner, sections);
    }
}

// The summaries stand below each other on the whole page.
std::string ListCommands(const CommandNamespace& space) {
    std::vector<Section> sections;
    CollectSections(space, sections);
    std::size_t width = 0;
    for (const Section& section : sections) {
        width = std::max(width, WidthOf(section.rows));
    }
    std::string list;
    for (const Section& section : sections) {
        list += '\n';
        list += (section.title.empty() ? "Commands without a namespace" : section.title) + ":\n";
        list += Table(section.rows, width);
    }
    return list;
}

// "--port=INTEGER", as the usage line and the list of options show it.
std::string Synopsis(const CommandOption& option) {
    switch (option.kind) {
    case ValueKind::Flag:
        break;
    case ValueKind::String:
        return "--" + option.name + "=TEXT";
    case ValueKind::Integer:
        return "--" + option.name + "=INTEGER";
    case ValueKind::Boolean:
        return "--" + option.name + "=true|false";
    case ValueKind::Choice:
        return "--" + option.name + "=" + Join(option.choices, "|");
    }
    return "--" + option.name;
}

std::string UsageOf(const CommandDescription& command) {
    std::string usage = "Usage: nvcli " + Join(command.path, " ");
    bool othersExist = false;
    for (const CommandOption& option : command.options) {
        if (option.required) {
            usage += " " + Synopsis(option);
        } else {
            othersExist = true;
        }
    }
    return usage + (othersExist ? " [OPTION]...\n" : "\n");
}

}  // namespace

std::string ProgramHelp(const CommandNamespace& root) {
    std::string page = "Usage: nvcli [OPTION]... NAMESPACE... COMMAND [COMMAND'S OPTION]...\n"
                       "\n"
                       "Runs one of the management commands that this host describes.\n"
                       "\n"
                       "Options:\n" +
                       Table({{"--directory=DIR", "Know the commands described in DIR, in place of "
                                                  "the host's; may be repeated"},
                              {"-h, --help", "Show this page, or that of a namespace or a command: "
                                             "nvcli WORD... --help"},
                              {"--version", "Show the version"}},
                             sizeof "--directory=DIR" - 1);
    const std::string list = ListCommands(root);
    page += list.empty() ? "\nNo command is described.\n" : list;
    return page;
}

std::string NamespaceHelp(const CommandNamespace& space) {
    const std::string path = Join(space.path, " ");
    return "Usage: nvcli " + path + " COMMAND [COMMAND'S OPTION]...\n" + ListCommands(space);
}

std::string CommandHelp(const CommandDescription& command) {
    Rows rows;
    for (const CommandOption& option : command.options) {
        const std::string letter =
            option.letter == '\0' ? "    " : std::string("-") + option.letter + ", ";
        rows.emplace_back(letter + Synopsis(option),
                          option.summary + (option.required ? " (required)" : ""));
        if (option.summary.empty() && option.required) {
            rows.back().second = "(required)";
        }
    }
    rows.emplace_back("-h, --help", "Show this page");
    return UsageOf(command) + "\n" + command.summary + "\n\nOptions:\n" +
           Table(rows, WidthOf(rows)) + "\nDescribed in " + command.file + "\n";
}

}  // namespace nvcli
