#ifndef VANTOR_ANALYZE_TESTS_ELFBUILDER_H
#define VANTOR_ANALYZE_TESTS_ELFBUILDER_H

#include <cstdint>
#include <string>
#include <vector>

#include "image/Architecture.h"

namespace vantor::support {

// The architectures whose relocations are known, and the one that a test takes when any will do.
extern const analyze::Architecture x86;
extern const analyze::Architecture x86With64Bits;
extern const analyze::Architecture arm;
extern const analyze::Architecture armWith64Bits;

// Makes shared objects of any architecture, without a compiler: a stripped one, of a single
// segment, with a hash table in the old style. Addresses are far from offsets in the file.
class ElfBuilder {
public:
    // A word of data.
    struct Word {
        enum class How { Plain, Relative, Symbolic };

        std::uint64_t value = 0;
        How how = How::Plain;
        std::string symbol;  // with Symbolic: what `value` is added to
    };
    static Word Null() { return {}; }
    static Word To(std::uint64_t address) { return {address, Word::How::Relative, {}}; }
    static Word ToSymbol(const std::string& name) { return {0, Word::How::Symbolic, name}; }

    struct Symbol {
        std::string name;
        std::uint64_t address = 0;  // 0: of another object
        std::uint64_t size = 0;
        unsigned char visibility = 0;  // STV_...
    };

    explicit ElfBuilder(const analyze::Architecture& kind);

    // These add data and return its address.
    std::uint64_t Bytes(const std::string& bytes);
    std::uint64_t Text(const std::string& text) { return Bytes(text + '\0'); }
    std::uint64_t Words(const std::vector<Word>& words);
    // The same in a segment of their own, with nothing loaded behind them. Once.
    std::uint64_t WordsAtTheEnd(const std::vector<Word>& words);
    // A list of pointers to names, with a null pointer at its end.
    std::uint64_t Names(const std::vector<std::string>& names);

    void Add(const Symbol& symbol) { symbols.push_back(symbol); }
    // A further entry of the dynamic section.
    void AddDynamic(std::uint64_t tag, std::uint64_t value) { dynamic.push_back({tag, value}); }

    // The same for one whose value is a text: DT_NEEDED, DT_SONAME, ...
    void AddDynamic(std::uint64_t tag, const std::string& text) {
        dynamicTexts.push_back({tag, text});
    }

    // The whole file.
    std::string Finish() const;

    // Writes a number over bytes of a file.
    static void Put(std::string& file, std::uint64_t offset, std::uint64_t number, std::size_t size,
                    bool bigEndian = false);

private:
    struct Relocation {
        std::uint64_t address;
        Word word;
    };
    struct Entry {
        std::uint64_t tag, value;
    };

    bool HasAddends() const;
    std::uint64_t Align();
    std::string Encode(const std::vector<Word>& words, std::uint64_t address);
    void PutWord(std::string& file, std::uint64_t offset, std::uint64_t value) const;
    void AppendWord(std::string& file, std::uint64_t value) const;
    std::uint64_t IndexOf(const std::string& symbol) const;
    std::string SymbolTable(std::string& names) const;
    std::string HashTable() const;
    std::string RelocationTable() const;
    void PutHeaders(std::string& file, std::uint64_t dynamicOffset, std::uint64_t end) const;

    analyze::Architecture architecture;
    std::size_t word;
    std::string content;  // from the beginning of the file
    std::string tail;
    std::vector<Relocation> relocations;
    std::vector<Symbol> symbols;
    struct TextEntry {
        std::uint64_t tag;
        std::string text;
    };
    std::vector<Entry> dynamic;
    std::vector<TextEntry> dynamicTexts;
};

// A plugin's two records in a builder; what is not set is null.
struct PluginRecords {
    std::int32_t version = 4;
    ElfBuilder::Word required, provided, pluginVersion, requiredFlags, disablingFlags;
    std::uint64_t runOnce = 0;
    ElfBuilder::Word start, applyHostProfile;

    // Adds both and exports them.
    void AddTo(ElfBuilder& builder) const;
};

}  // namespace vantor::support

#endif
