#ifndef VANTOR_ANALYZE_CHART_BARRIERFLAGS_H
#define VANTOR_ANALYZE_CHART_BARRIERFLAGS_H

#include <cstddef>
#include <vector>

namespace vantor::analyze {

// A label that hangs on a vertical mark like a flag on its pole: it begins at the mark and stands
// on one of several levels above the drawing, to which the mark then reaches up.
struct Flag {
    static constexpr int noLevel = -1;

    double x = 0;         // of the mark
    double width = 0;     // of the label, with the room it needs
    bool first = false;   // to be placed before those that are not
    int level = noLevel;  // where it is placed, from 0, the lowest; noLevel: without a label
};

// Gives as many flags as possible a level, so that no label reaches another, or the pole of
// another, or beyond `right`. Those that are `first` come first, then from left to right.
void PlaceFlags(std::vector<Flag>& flags, int levels, double right);

}  // namespace vantor::analyze

#endif
