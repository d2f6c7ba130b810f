#include "image/NativeDescription.h"

#include <set>
#include <stdexcept>
#include <utility>

#include "image/LinkScope.h"
#include "image/LinkerRefusal.h"
#include "image/SharedObject.h"
#include "plugins/Exceptions.h"

namespace vantor::analyze {

namespace {

constexpr std::int32_t oldestVersion = 1;
constexpr std::int32_t newestVersion = 4;
constexpr std::int32_t hostProfileVersion = 2;  // first version with an apply-host-profile entry
constexpr std::int32_t flagsVersion = 3;        // first version with the long metadata record

constexpr const char* noPointer =
    " cannot be found: the pointer to it is not in the file, or relocated in an unknown way";

// A record that the boot would read, or jump, out of bounds with.
class BadRecord : public std::runtime_error {
public:
    using std::runtime_error::runtime_error;
};

// Offsets within the metadata record: a 32-bit version, then fields of a word each but for
// run_once, which is a byte padded to a word.
struct MetadataLayout {
    explicit MetadataLayout(std::uint64_t word)
        : required(word),
          provided(2 * word),
          shortEnd(3 * word),
          pluginVersion(3 * word),
          runOnce(4 * word),
          requiredFlags(5 * word),
          disablingFlags(6 * word),
          longEnd(7 * word) {}

    std::uint64_t required, provided, shortEnd;
    std::uint64_t pluginVersion, runOnce, requiredFlags, disablingFlags, longEnd;
};

// Takes the two exported records of one object apart.
class RecordReader {
public:
    RecordReader(const SharedObject& sharedObject, NativeReading& result)
        : object(sharedObject),
          file(object.File()),
          layout(file.WordSize()),
          versions(sharedObject),
          reading(result),
          textLeft(4 * file.FileSize() + 65536) {}

    // `address` is that of the metadata record. Throws BadRecord.
    std::int32_t Version(std::uint64_t address) const;
    void ReadMetadata(std::uint64_t address);
    // Returns whether there is a start entry.
    bool ReadOperations(std::uint64_t address);
    // What only loading can find.
    const std::vector<std::string>& Elsewhere() const { return elsewhere; }

private:
    LoadedPointer Field(std::uint64_t address, const std::string& what);
    void NoteShared(const LoadedPointer& pointer, const std::string& what);
    std::vector<std::string> Names(std::uint64_t field, const std::string& what);
    std::vector<BarrierName> Barriers(std::uint64_t field, const std::string& what);
    std::set<std::string> Flags(std::uint64_t field, const std::string& what);
    std::string Text(std::uint64_t address, const std::string& what);

    const SharedObject& object;
    const ElfFile& file;
    const MetadataLayout layout;
    const SymbolVersions versions;
    NativeReading& reading;
    std::vector<std::string> elsewhere;  // what lies in other objects
    std::uint64_t textLeft;              // as much as no honest record names; keeps the time linear
};

std::int32_t RecordReader::Version(std::uint64_t address) const {
    const std::optional<std::uint64_t> version = file.Number(address, 4);
    if (!version) {
        throw BadRecord("the record \"metadata\" is not in the file");
    }
    return static_cast<std::int32_t>(static_cast<std::uint32_t>(*version));
}

void RecordReader::ReadMetadata(std::uint64_t address) {
    PluginDescription& plugin = reading.plugin;
    plugin.apiVersion = Version(address);
    plugin.provided = Barriers(address + layout.provided, "the list of provided barriers");
    plugin.required = Barriers(address + layout.required, "the list of required barriers");
    if (plugin.apiVersion < flagsVersion) {
        return;  // the record ends here
    }
    plugin.requiredFlags = Flags(address + layout.requiredFlags, "the list of required flags");
    plugin.disablingFlags = Flags(address + layout.disablingFlags, "the list of disabling flags");
    const std::optional<std::uint64_t> runOnce = file.Number(address + layout.runOnce, 1);
    if (!runOnce) {
        throw BadRecord("the record \"metadata\" is not in the file");
    }
    plugin.runOnce = *runOnce != 0;
    const std::string what = "the plugin version";
    const LoadedPointer version = Field(address + layout.pluginVersion, what);
    if (version.kind != LoadedPointer::Kind::Null) {
        plugin.pluginVersion = Text(version.address, what);
    }
}

bool RecordReader::ReadOperations(std::uint64_t address) {
    const auto entry = [this](std::uint64_t place, const std::string& what) {
        const std::optional<LoadedPointer> pointer = object.Pointer(place);
        if (!pointer) {
            throw BadRecord(what + noPointer);
        }
        if (pointer->kind == LoadedPointer::Kind::Inside && !file.Number(pointer->address, 1)) {
            throw BadRecord(what + " points out of the file");
        }
        NoteShared(*pointer, what);
        return pointer->kind != LoadedPointer::Kind::Null;
    };
    const bool starts = entry(address, "the start entry");
    if (reading.plugin.apiVersion >= hostProfileVersion) {
        entry(address + file.WordSize(), "the apply-host-profile entry");
    }
    return starts;
}

// A pointer to data: null, or within the object.
LoadedPointer RecordReader::Field(std::uint64_t address, const std::string& what) {
    const std::optional<LoadedPointer> pointer = object.Pointer(address);
    if (!pointer) {
        throw BadRecord(what + noPointer);
    }
    if (pointer->kind == LoadedPointer::Kind::Outside) {
        elsewhere.push_back(what);
        return {};
    }
    NoteShared(*pointer, what);
    return *pointer;
}

void RecordReader::NoteShared(const LoadedPointer& pointer, const std::string& what) {
    if (pointer.kind == LoadedPointer::Kind::Inside && !pointer.symbol.empty()) {
        reading.sharedParts.push_back(
            {what, {std::string(pointer.symbol), versions.NameOf(pointer.version)}});
    }
}

std::vector<std::string> RecordReader::Names(std::uint64_t field, const std::string& what) {
    std::vector<std::string> names;
    const LoadedPointer list = Field(field, what);
    if (list.kind == LoadedPointer::Kind::Null) {
        return names;
    }
    for (std::uint64_t place = list.address;; place += file.WordSize()) {
        const std::optional<LoadedPointer> item = object.Pointer(place);
        if (!item) {
            throw BadRecord(
                what + (names.empty() ? " is not in the file" : " has no null pointer at its end"));
        }
        if (item->kind == LoadedPointer::Kind::Null) {
            return names;
        }
        if (item->kind == LoadedPointer::Kind::Outside) {
            elsewhere.push_back("a name in " + what);
            continue;
        }
        names.push_back(Text(item->address, what));
    }
}

std::vector<BarrierName> RecordReader::Barriers(std::uint64_t field, const std::string& what) {
    std::vector<BarrierName> barriers;
    for (std::string& name : Names(field, what)) {
        barriers.push_back({std::move(name), reading.plugin.place});
    }
    return barriers;
}

std::set<std::string> RecordReader::Flags(std::uint64_t field, const std::string& what) {
    const std::vector<std::string> names = Names(field, what);
    return {names.begin(), names.end()};
}

std::string RecordReader::Text(std::uint64_t address, const std::string& what) {
    const std::string_view bytes = file.Bytes(address, textLeft);
    const std::size_t end = bytes.find('\0');
    const std::size_t size = end == std::string_view::npos ? bytes.size() : end;
    const bool ended = end != std::string_view::npos || file.IsZeroFilled(address + size);
    if (!ended || size + 1 > textLeft) {
        throw BadRecord(
            what + (bytes.empty() ? " points out of the file" : " holds a text without an end"));
    }
    textLeft -= size + 1;
    return std::string(bytes.substr(0, size));
}

// The linker's words say little of what is wrong.
std::string MadeFor(const std::string& content, const Architecture& boot) {
    const std::optional<Architecture> own = ArchitectureOf(content);
    return own ? " (made for " + own->Text() + ", the boot is for " + boot.Text() + ")" : "";
}

// One shared object on its way to a description.
class NativeReader {
public:
    NativeReader(const PluginSource& pluginSource, Findings& allFindings, LinkScope* linkScope)
        : source(pluginSource), findings(allFindings), scope(linkScope) {
        reading.plugin.place = source.place;
    }

    std::optional<NativeReading> Read(const std::string& content, const Architecture& boot);

private:
    void Report(Severity severity, const std::string& code, const std::string& text) {
        findings.push_back({severity, code, source.place, text});
    }
    void Reject(const std::string& code, const std::string& reason) {
        Report(Severity::Error, code, InvalidPluginException(source.bootPath, reason).what());
    }
    bool MayBeOpened(const ElfFile& file);
    bool PassesLinker(const std::string& content, const Architecture& boot);
    // Null where a library of the plugin's own has it; empty where it is rejected.
    std::optional<const SharedObject::Symbol*> Find(const SharedObject& object,
                                                    const std::string& name);
    void TellUndetermined(const std::string& what);
    bool ReadRecords(const SharedObject& object);
    void CheckSize(const SharedObject::Symbol& record, std::uint64_t needed);

    const PluginSource& source;
    Findings& findings;
    LinkScope* const scope;
    NativeReading reading;
};

bool NativeReader::PassesLinker(const std::string& content, const Architecture& boot) {
    const LinkerRefusal refusal = AskLinker(content, boot);
    const std::string linkersWords = source.bootPath + ": " + refusal.reason;
    switch (refusal.kind) {
    case LinkerRefusal::Kind::None:
        return true;
    case LinkerRefusal::Kind::Refused:
        Reject("rejected", linkersWords);
        break;
    case LinkerRefusal::Kind::Foreign:
        Reject("foreign-architecture", linkersWords + MadeFor(content, boot));
        break;
    case LinkerRefusal::Kind::Truncated:
        Reject("truncated", refusal.reason);
        break;
    }
    return false;
}

// The linker tells plain executables by their header, and those that are shared objects as well by
// a flag.
bool NativeReader::MayBeOpened(const ElfFile& file) {
    constexpr std::uint64_t positionIndependentExecutable = DF_1_PIE;
    constexpr std::uint64_t notToBeOpened = DF_1_NOOPEN;
    const std::uint64_t flags = file.Dynamic(DT_FLAGS_1).value_or(0);
    if ((flags & positionIndependentExecutable) != 0) {
        Reject("rejected",
               source.bootPath + ": cannot dynamically load position-independent executable");
        return false;
    }
    if ((flags & notToBeOpened) != 0) {
        Reject("rejected", source.bootPath + ": shared object cannot be dlopen()ed");
        return false;
    }
    return true;
}

std::optional<const SharedObject::Symbol*> NativeReader::Find(const SharedObject& object,
                                                              const std::string& name) {
    const SharedObject::Symbol* const symbol = object.Find(name);
    if (symbol == nullptr && scope != nullptr && scope->LibrariesDefine(reading.opened, name)) {
        return symbol;
    }
    if (symbol == nullptr) {
        Reject("rejected", source.bootPath + ": undefined symbol: " + name);
    } else if (symbol->address == 0) {
        Reject("rejected", "symbol " + name + " has no address");
    } else {
        return symbol;
    }
    return std::nullopt;
}

void NativeReader::CheckSize(const SharedObject::Symbol& record, std::uint64_t needed) {
    if (record.size != 0 && record.size < needed) {
        Report(Severity::Warning, "short-record",
               "the record \"" + std::string(record.name) + "\" is " + std::to_string(record.size) +
                   " bytes long; of version " + std::to_string(reading.plugin.apiVersion) +
                   " the boot reads " + std::to_string(needed));
    }
}

void NativeReader::TellUndetermined(const std::string& what) {
    Report(Severity::Warning, "undetermined",
           what + ": only loading the plugin tells what it says there, so that is not looked at");
}

bool NativeReader::ReadRecords(const SharedObject& object) {
    const auto foundOperations = Find(object, "operations");
    const auto foundMetadata = foundOperations ? Find(object, "metadata") : std::nullopt;
    if (!foundMetadata) {
        return false;
    }
    const SharedObject::Symbol* const operations = *foundOperations;
    const SharedObject::Symbol* const metadata = *foundMetadata;
    if (operations == nullptr || metadata == nullptr) {
        TellUndetermined("a record of the plugin lies in a library that it brings with it");
        return true;
    }
    RecordReader records(object, reading);
    const std::int32_t version = records.Version(metadata->address);
    if (version == 0 && object.File().IsZeroFilled(metadata->address)) {
        TellUndetermined("the record \"metadata\" is written while the plugin is loaded, or never");
        return true;
    }
    if (version < oldestVersion || version > newestVersion) {
        Reject("unsupported-version", "Unsupported API version");
        return false;
    }
    records.ReadMetadata(metadata->address);
    const bool starts = records.ReadOperations(operations->address);
    if (!records.Elsewhere().empty()) {
        TellUndetermined(records.Elsewhere().front() + " lies in another object");
    }
    if (!starts) {
        Report(Severity::Warning, "null-start", "the start entry is null: the boot runs nothing");
    }
    const std::uint64_t word = object.File().WordSize();
    const MetadataLayout layout(word);
    CheckSize(*metadata, version < flagsVersion ? layout.shortEnd : layout.longEnd);
    CheckSize(*operations, version < hostProfileVersion ? word : 2 * word);
    return true;
}

std::optional<NativeReading> NativeReader::Read(const std::string& content,
                                                const Architecture& boot) {
    try {
        if (!PassesLinker(content, boot)) {
            return std::nullopt;
        }
        const ElfFile file(content);
        if (!MayBeOpened(file)) {
            return std::nullopt;
        }
        const SharedObject object(file);
        if (scope != nullptr) {
            reading.opened = scope->Open(source, Linkage(object));
        }
        if (!ReadRecords(object)) {
            return std::nullopt;
        }
        return std::move(reading);
    } catch (const ElfError& error) {
        Report(Severity::Error, "bad-object", error.what());
    } catch (const BadRecord& error) {
        Report(Severity::Error, "bad-record", error.what());
    }
    return std::nullopt;
}

}  // namespace

std::optional<NativeReading> ReadNative(const std::string& content, const Architecture& boot,
                                        const PluginSource& source, Findings& findings,
                                        LinkScope* scope) {
    return NativeReader(source, findings, scope).Read(content, boot);
}

}  // namespace vantor::analyze
