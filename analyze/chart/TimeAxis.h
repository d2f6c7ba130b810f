#ifndef VANTOR_ANALYZE_CHART_TIMEAXIS_H
#define VANTOR_ANALYZE_CHART_TIMEAXIS_H

#include <cstddef>
#include <string>
#include <vector>

#include "boot/BootLog.h"

namespace vantor::analyze {

// A mark of the axis and what stands beside it.
struct Tick {
    double x = 0;
    std::string label;
};

// A piece of the drawing between two moments. Never of a negative width, and never outside the
// axis.
struct Span {
    double x = 0;
    double width = 0;
};

// Maps moments to the drawing's horizontal coordinate. Any moments will do: those outside the axis
// are drawn at its ends, and an axis without length has all of them at its left end.
class TimeAxis {
public:
    TimeAxis(Microseconds first, Microseconds last, double left, double right);

    double X(Microseconds time) const;
    bool IsBeyond(Microseconds time) const { return static_cast<double>(time) > last; }

    // What lies between two moments, at least `least` wide so that it can be seen. The wrong way
    // round, as a clock that was set back leaves them, it is as long as if nothing lay between.
    Span Between(Microseconds from, Microseconds until, double least) const;

    // At round times, at most `most` of them, from left to right.
    std::vector<Tick> Ticks(std::size_t most) const;

    double Left() const { return left; }
    double Right() const { return right; }

private:
    double first;
    double last;
    double left;
    double right;
};

}  // namespace vantor::analyze

#endif
