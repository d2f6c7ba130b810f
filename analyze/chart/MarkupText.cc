#include "chart/MarkupText.h"

#include <fmt/format.h>

#include <algorithm>

namespace vantor::analyze {

namespace {

unsigned Byte(std::string_view text, std::size_t at) {
    return static_cast<unsigned char>(text[at]);
}

bool IsContinuation(unsigned byte) { return (byte & 0xC0U) == 0x80U; }

// How many bytes a character has that begins with this one; 0 for a byte that begins none.
std::size_t LengthAfter(unsigned first) {
    if (first < 0x80) {
        return 1;
    }
    if (first >= 0xC2 && first <= 0xDF) {
        return 2;
    }
    if (first >= 0xE0 && first <= 0xEF) {
        return 3;
    }
    return first >= 0xF0 && first <= 0xF4 ? 4 : 0;
}

struct Character {
    char32_t code = 0;
    std::size_t length = 0;  // in bytes; 0: the byte here is no part of a character
};

Character CharacterAt(std::string_view text, std::size_t at) {
    const unsigned first = Byte(text, at);
    const std::size_t length = LengthAfter(first);
    if (length <= 1 || at + length > text.size()) {
        return {first, length == 1 ? std::size_t{1} : 0};
    }
    char32_t code = first & (0x7FU >> length);
    for (std::size_t i = 1; i < length; ++i) {
        if (!IsContinuation(Byte(text, at + i))) {
            return {};
        }
        code = (code << 6U) | (Byte(text, at + i) & 0x3FU);
    }
    const bool overlong = (length == 3 && code < 0x800) || (length == 4 && code < 0x10000);
    const bool surrogate = code >= 0xD800 && code <= 0xDFFF;
    return overlong || surrogate || code > 0x10FFFF ? Character{} : Character{code, length};
}

// Whether a character would be lost, refused by XML, or change how its neighbours are shown.
bool Hides(char32_t code) {
    return code < 0x20 || (code >= 0x7F && code <= 0x9F) || (code >= 0x200B && code <= 0x200F) ||
           (code >= 0x2028 && code <= 0x202E) || (code >= 0x2060 && code <= 0x206F) ||
           code == 0xFEFF || (code & 0xFFFEU) == 0xFFFE;
}

// The first byte of the character that holds the one at `at`.
std::size_t BeginOfCharacter(std::string_view text, std::size_t at) {
    while (at > 0 && at < text.size() && IsContinuation(Byte(text, at))) {
        --at;
    }
    return at;
}

}  // namespace

std::string Printable(std::string_view bytes) {
    std::string text;
    for (std::size_t at = 0; at < bytes.size();) {
        const Character character = CharacterAt(bytes, at);
        if (character.length == 0) {
            text += fmt::format("\\x{:02x}", Byte(bytes, at));
            ++at;
            continue;
        }
        if (Hides(character.code)) {
            const auto code = static_cast<unsigned>(character.code);
            text += code < 0x80 ? fmt::format("\\x{:02x}", code) : fmt::format("\\u{:04x}", code);
        } else {
            text += bytes.substr(at, character.length);
        }
        at += character.length;
    }
    return text;
}

std::string Escaped(std::string_view printable) {
    std::string text;
    text.reserve(printable.size());
    for (const char character : printable) {
        switch (character) {
        case '&':
            text += "&amp;";
            break;
        case '<':
            text += "&lt;";
            break;
        case '>':
            text += "&gt;";
            break;
        case '"':
            text += "&quot;";
            break;
        case '\'':
            text += "&#39;";
            break;
        default:
            text += character;
        }
    }
    return text;
}

std::size_t Columns(std::string_view printable) {
    std::size_t columns = 0;
    for (std::size_t at = 0; at < printable.size(); ++at) {
        const unsigned byte = Byte(printable, at);
        columns += byte < 0x80 ? 1U : IsContinuation(byte) ? 0U : 2U;
    }
    return columns;
}

bool IsAscii(std::string_view text) {
    return std::all_of(text.begin(), text.end(),
                       [](char byte) { return static_cast<unsigned char>(byte) < 0x80; });
}

std::string Shortened(std::string_view printable, std::size_t columns) {
    if (Columns(printable) <= columns) {
        return std::string(printable);
    }
    const std::size_t kept = std::max<std::size_t>(columns, 3) - 2;  // the dots take two
    std::size_t begin = 0;
    for (std::size_t taken = 0; taken < (kept + 1) / 2;) {
        const std::size_t length = CharacterAt(printable, begin).length;
        taken += length == 1 ? 1 : 2;
        if (taken <= (kept + 1) / 2) {
            begin += length;
        }
    }
    std::size_t end = printable.size();
    for (std::size_t taken = 0; taken < kept / 2;) {
        const std::size_t before = BeginOfCharacter(printable, end - 1);
        taken += end - before == 1 ? 1 : 2;
        if (taken <= kept / 2) {
            end = before;
        }
    }
    return fmt::format("{}…{}", printable.substr(0, begin), printable.substr(end));
}

}  // namespace vantor::analyze
