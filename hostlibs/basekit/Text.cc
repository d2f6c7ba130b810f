#include "basekit/Text.h"

#include <system_error>

#include "basekit/Tokenizer.h"

namespace BaseKit::impl {

bool IsLetter(char c) { return (c >= 'a' && c <= 'z') || (c >= 'A' && c <= 'Z'); }

std::string Shortened(std::string_view text, std::size_t limit) {
    if (text.size() <= limit) {
        return std::string(text);
    }
    std::size_t end = limit;
    while (end > 0 && (static_cast<unsigned char>(text[end]) & 0xC0U) == 0x80U) {
        --end;
    }
    return std::string(text.substr(0, end)) + "...";
}

std::string Quoted(std::string_view text) { return "\"" + Shortened(text, 200) + "\""; }

std::string JoinPath(const std::vector<std::string>& path) {
    std::string joined;
    for (const std::string& word : path) {
        joined += (joined.empty() ? "" : " ") + QuoteWord(word);
    }
    return joined;
}

std::string QuotedOption(std::string_view name) {
    return Quoted((name.size() == 1 ? "-" : "--") + std::string(name));
}

std::string ErrnoText(int error) { return std::generic_category().message(error); }

}  // namespace BaseKit::impl
