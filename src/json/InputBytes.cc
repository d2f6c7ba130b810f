#include "json/InputBytes.h"

#include <locale.h>
#include <stdlib.h>

#include <array>
#include <cfloat>
#include <cmath>
#include <cstdint>
#include <cstring>
#include <locale>
#include <optional>

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

// A decimal without exponent and of few digits, as strtod(3) converts it: the digits as a whole
// number and the power of ten are doubles without error, and their quotient is rounded once (W. D.
// Clinger, How to Read Floating Point Numbers Accurately, 1990). Where the processor calculates in
// a longer format it would be rounded twice: whole numbers only.
std::optional<double> ConvertShort(std::string_view text) {
    static constexpr double powers[] = {1e0, 1e1, 1e2,  1e3,  1e4,  1e5,  1e6,  1e7,
                                        1e8, 1e9, 1e10, 1e11, 1e12, 1e13, 1e14, 1e15};
    constexpr std::size_t mostDigits = std::size(powers) - 1;
    const bool negative = text.front() == '-';
    std::int64_t whole = 0;
    std::size_t digits = 0;
    std::size_t fraction = 0;
    bool behindPoint = false;
    for (const char byte : text.substr(negative ? 1 : 0, mostDigits + 2)) {
        if (byte == '.') {
            behindPoint = true;
        } else if (IsDigit(byte)) {
            whole = whole * 10 + (byte - '0');
            ++digits;
            fraction += behindPoint ? 1 : 0;
        } else {
            return std::nullopt;
        }
    }
    if (digits == 0 || digits > mostDigits || (fraction != 0 && FLT_EVAL_METHOD != 0)) {
        return std::nullopt;
    }
    const double number = static_cast<double>(whole) / powers[fraction];
    return negative ? -number : number;
}

// By the very function that the extraction of a double ends in, strtod_l(3): std::from_chars() of
// the 32-bit library may differ from it in the last bit. Nothing for what is not wholly a number,
// and for one too large for a double.
std::optional<double> ConvertAsExtractionDoes(std::string_view text) {
    static const locale_t classic = newlocale(LC_ALL_MASK, "C", nullptr);
    std::array<char, longestNumber + 1> digits;
    std::memcpy(digits.data(), text.data(), text.size());
    digits[text.size()] = '\0';
    char* stop = nullptr;
    const double number = strtod_l(digits.data(), &stop, classic);
    if (stop != digits.data() + text.size() || !std::isfinite(number)) {
        return std::nullopt;
    }
    return number;
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
    if (text.empty() || text.size() == area.size() || text.size() > longestNumber) {
        return false;
    }
    std::optional<double> converted = ConvertShort(text);
    if (!converted) {
        converted = ConvertAsExtractionDoes(text);
    }
    if (!converted) {
        return false;
    }
    GetArea::Skip(buffer, text.size());
    number = *converted;
    return true;
}

}  // namespace vantor
