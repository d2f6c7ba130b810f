#include "json/InputBytes.h"

#include <locale.h>
#include <stdlib.h>

#include <array>
#include <cmath>
#include <cstring>
#include <locale>

namespace vantor {

namespace {

// How far ahead the end of a plain text is looked for at a time: beyond the end of most strings,
// and near enough to look again after each of many backslashes.
constexpr std::size_t longestLook = 256;

// Longer numbers are left to the extraction.
constexpr std::size_t longestNumber = 63;

bool IsBlank(int byte) { return byte == ' ' || (byte >= '\t' && byte <= '\r'); }

bool IsDigit(char byte) { return byte >= '0' && byte <= '9'; }

// The part of the text that the extraction of a number consumes, if the number is one that it
// accepts and that does not begin with a plus sign.
std::string_view NumberAtBeginning(std::string_view text) {
    const char* next = text.data();
    const char* const end = next + text.size();
    const auto accept = [&next, end](char one, char other) {
        const bool accepted = next != end && (*next == one || *next == other);
        next += accepted ? 1 : 0;
        return accepted;
    };
    const auto skipDigits = [&next, end] {
        while (next != end && IsDigit(*next)) {
            ++next;
        }
    };
    accept('-', '-');
    skipDigits();
    if (accept('.', '.')) {
        skipDigits();
    }
    if (accept('e', 'E')) {
        accept('-', '+');
        skipDigits();
    }
    return text.substr(0, static_cast<std::size_t>(next - text.data()));
}

// By the very function that the extraction of a double ends in, strtod_l(3): std::from_chars() of
// the 32-bit library may differ from it in the last bit.
double ConvertAsExtractionDoes(const char* text, char*& stop) {
    static const locale_t classic = newlocale(LC_ALL_MASK, "C", nullptr);
    return strtod_l(text, &stop, classic);
}

}  // namespace

InputBytes::InputBytes(std::istream& source)
    : stream(source),
      state(source),
      buffer(*source.rdbuf()),
      plainNumbers(source.getloc() == std::locale::classic()) {}

void InputBytes::PutBack() {
    if (buffer.sungetc() == end) {
        state.setstate(std::ios_base::badbit);
    }
}

bool InputBytes::Take(char* bytes, std::size_t count) {
    const std::string_view area = GetArea::Of(buffer);
    if (area.size() >= count) {
        std::memcpy(bytes, area.data(), count);
        GetArea::Skip(buffer, count);
        return true;
    }
    const auto wanted = static_cast<std::streamsize>(count);
    if (buffer.sgetn(bytes, wanted) == wanted) {
        return true;
    }
    state.setstate(std::ios_base::eofbit | std::ios_base::failbit);
    return false;
}

void InputBytes::SkipWhiteSpace() {
    do {
        const std::string_view area = GetArea::Of(buffer);
        std::size_t blanks = 0;
        while (blanks < area.size() && IsBlank(area[blanks])) {
            ++blanks;
        }
        GetArea::Skip(buffer, blanks);
    } while (IsBlank(Peek()) && Take() != end);
}

std::string_view InputBytes::TakePlainText() {
    std::string_view text = GetArea::Of(buffer).substr(0, longestLook);
    text = text.substr(0, text.find('"'));
    text = text.substr(0, text.find('\\'));
    GetArea::Skip(buffer, text.size());
    return text;
}

void InputBytes::Number(double& number) {
    if (!plainNumbers || !NumberFromGetArea(number)) {
        stream >> number;
    }
}

// Consumes a number that lies whole in the get area, with the byte behind it that shows its end.
// False, with nothing consumed, for any other, and for one that the extraction might not accept.
bool InputBytes::NumberFromGetArea(double& number) {
    const std::string_view area = GetArea::Of(buffer);
    const std::string_view text = NumberAtBeginning(area);
    std::array<char, longestNumber + 1> digits;
    if (text.empty() || text.size() == area.size() || text.size() > longestNumber) {
        return false;
    }
    std::memcpy(digits.data(), text.data(), text.size());
    digits[text.size()] = '\0';
    char* stop = nullptr;
    const double converted = ConvertAsExtractionDoes(digits.data(), stop);
    if (stop != digits.data() + text.size() || !std::isfinite(converted)) {
        return false;
    }
    GetArea::Skip(buffer, text.size());
    number = converted;
    return true;
}

}  // namespace vantor
