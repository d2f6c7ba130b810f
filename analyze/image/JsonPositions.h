#ifndef VANTOR_ANALYZE_IMAGE_JSONPOSITIONS_H
#define VANTOR_ANALYZE_IMAGE_JSONPOSITIONS_H

#include <cstddef>
#include <map>
#include <string>
#include <vector>

#include "json/PluginDocument.h"

namespace vantor::analyze {

// Where the values of a plugin document stand, and how far the boot's reader (json/JsonReader.h)
// gets in it. Looks at the text as that reader does, leniency and all, but ends with every text:
// also with one that the reader would read for ever. Uses no recursion; time and memory are in
// proportion to the text.
class JsonPositions {
public:
    explicit JsonPositions(const std::string& documentText);

    // What the reader would come to.
    enum class End {
        Whole,      // the end of the root value
        Broken,     // what is no JSON
        LoneSlash,  // a slash that begins no comment: it never gets past it
        TooDeep,    // more levels than it reads
    };
    End Ending() const { return ending; }

    // Both counted from 1, the column in characters of UTF-8.
    struct Position {
        int line;
        int column;
    };

    // Where it came to it; of an open text or comment, where that begins.
    Position Stop() const { return At(stop); }

    // Where the value stands, or where it is missing the innermost one around its place.
    Position Of(const DocumentPlace& place) const;

private:
    // The places of values, down to as many levels as a plugin document has.
    struct Value {
        std::size_t offset = 0;
        std::map<std::string, Value> members;
        std::vector<Value> elements;
    };
    friend class JsonPositionsScan;

    Position At(std::size_t offset) const;

    End ending = End::Whole;
    std::size_t stop = 0;
    Value root;
    std::vector<std::size_t> lines;   // where each begins
    std::vector<std::size_t> within;  // bytes that continue a character
};

}  // namespace vantor::analyze

#endif
