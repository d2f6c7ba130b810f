#include "chart/TimeAxis.h"

#include <fmt/format.h>

#include <algorithm>
#include <array>
#include <cmath>

namespace vantor::analyze {

namespace {

// A unit for labels: what it is called, its length, and the steps between labels that are round in
// it, in microseconds.
struct Unit {
    const char* name;
    double length;
    std::array<double, 9> steps;  // in units, ascending; 0 where there are fewer
};

constexpr std::array<Unit, 6> units{{
    {"µs", 1, {1, 2, 5, 10, 20, 50, 100, 200, 500}},
    {"ms", 1e3, {1, 2, 5, 10, 20, 50, 100, 200, 500}},
    {"s", 1e6, {1, 2, 5, 10, 20, 30, 0, 0, 0}},
    {"min", 6e7, {1, 2, 5, 10, 20, 30, 0, 0, 0}},
    {"h", 3.6e9, {1, 2, 4, 6, 12, 0, 0, 0, 0}},
    {"d", 8.64e10, {1, 2, 5, 10, 20, 50, 100, 200, 500}},
}};

struct Step {
    const Unit* unit;
    double length;
};

// The smallest round step that cuts `range` into fewer than `most` parts.
Step RoundStep(double range, std::size_t most) {
    const double least = range / static_cast<double>(std::max<std::size_t>(most, 2) - 1);
    for (const Unit& unit : units) {
        for (const double step : unit.steps) {
            if (step > 0 && step * unit.length >= least) {
                return {&unit, step * unit.length};
            }
        }
    }
    const Unit& days = units.back();
    return {&days, std::pow(10, std::ceil(std::log10(least / days.length))) * days.length};
}

}  // namespace

TimeAxis::TimeAxis(Microseconds firstTime, Microseconds lastTime, double leftEnd, double rightEnd)
    : first(static_cast<double>(firstTime)),
      last(static_cast<double>(lastTime)),
      left(leftEnd),
      right(rightEnd) {}

double TimeAxis::X(Microseconds time) const {
    if (last <= first) {
        return left;
    }
    const double part = (static_cast<double>(time) - first) / (last - first);
    return left + std::clamp(part, 0.0, 1.0) * (right - left);
}

Span TimeAxis::Between(Microseconds from, Microseconds until, double least) const {
    const double begin = X(from);
    const double width = std::max(X(until) - begin, least);
    return {std::max(left, std::min(begin, right - width)), std::min(width, right - left)};
}

std::vector<Tick> TimeAxis::Ticks(std::size_t most) const {
    if (last <= first) {
        return {{left, "0"}};
    }
    const Step step = RoundStep(last - first, most);
    const double begin = std::ceil(first / step.length);
    std::vector<Tick> ticks;
    for (std::size_t i = 0; i < most; ++i) {
        const double number = begin + static_cast<double>(i);
        const double time = number * step.length;
        if (time > last) {
            break;
        }
        const double x = left + (time - first) / (last - first) * (right - left);
        const bool zero = std::abs(number) < 0.5;
        ticks.push_back(
            {x, zero ? "0" : fmt::format("{:.0f} {}", time / step.unit->length, step.unit->name)});
    }
    return ticks;
}

}  // namespace vantor::analyze
