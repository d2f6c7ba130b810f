#include "chart/TimeText.h"

#include <fmt/format.h>

#include <cstdint>

namespace vantor::analyze {

namespace {

constexpr std::uint64_t millisecond = 1000;
constexpr std::uint64_t second = 1000 * millisecond;
constexpr std::uint64_t minute = 60 * second;
constexpr std::uint64_t hour = 60 * minute;
constexpr std::uint64_t day = 24 * hour;

// The absolute value, also of the lowest one.
std::uint64_t Magnitude(Microseconds time) {
    const auto bits = static_cast<std::uint64_t>(time);
    return time < 0 ? 0 - bits : bits;
}

// A value with as many decimals as leave three digits.
std::string ThreeDigits(std::uint64_t time, std::uint64_t unit, const char* name) {
    const double value = static_cast<double>(time) / static_cast<double>(unit);
    const int decimals = time < 10 * unit ? 2 : time < 100 * unit ? 1 : 0;
    return fmt::format("{:.{}f} {}", value, decimals, name);
}

std::string Rounded(std::uint64_t time) {
    if (time < millisecond) {
        return fmt::format("{} µs", time);
    }
    if (time < second) {
        return ThreeDigits(time, millisecond, "ms");
    }
    if (time < minute) {
        return ThreeDigits(time, second, "s");
    }
    if (time < hour) {
        return fmt::format("{} min {:02} s", time / minute, time % minute / second);
    }
    if (time < day) {
        return fmt::format("{} h {:02} min", time / hour, time % hour / minute);
    }
    return fmt::format("{} d {} h", time / day, time % day / hour);
}

}  // namespace

std::string RoundedTime(Microseconds time) {
    return (time < 0 ? "-" : "") + Rounded(Magnitude(time));
}

std::string ExactTime(Microseconds time) {
    const std::uint64_t length = Magnitude(time);
    const char* const sign = time < 0 ? "-" : "";
    if (length < second) {
        return fmt::format("{}{}.{:03} ms", sign, length / millisecond, length % millisecond);
    }
    return fmt::format("{}{}.{:06} s", sign, length / second, length % second);
}

}  // namespace vantor::analyze
