#ifndef VANTOR_ANALYZE_MODEL_NEARESTNAME_H
#define VANTOR_ANALYZE_MODEL_NEARESTNAME_H

#include <array>
#include <cstddef>
#include <cstdint>
#include <string>
#include <string_view>
#include <vector>

namespace vantor::analyze {

// How many characters must be put in, taken out, replaced or swapped with their neighbour to turn
// one text into the other; `limit` + 1 for any number above `limit`.
std::size_t TypingDistance(std::string_view from, std::string_view to, std::size_t limit);

// Finds what somebody who wrote an unknown name may have meant: the known name with the fewest
// slips, letters of the other case being none. Up to one character in three may be wrong, three at
// most; of names of one or two characters only the case. Names above 64 characters are not
// compared.
class NearestName {
public:
    // How many characters all questions together may compare: they are answered in bounded time,
    // however many names there are. Once that is used up nothing is found any more.
    static constexpr std::uint64_t comparisonLimit = 200'000'000;

    explicit NearestName(const std::vector<std::string>& names,
                         std::uint64_t limit = comparisonLimit);

    // The nearest known name, of several the first by bytes; empty when none is near, or when the
    // name itself is known. Not for two threads at once.
    std::string Find(const std::string& unknown);

private:
    struct Known {
        std::string folded;  // in lower case
        std::string name;
        std::uint64_t letters = 0;  // a bit for each class of characters that occur
    };

    static constexpr std::size_t longest = 64;

    std::array<std::vector<Known>, longest + 1> byLength;
    std::uint64_t left;
};

}  // namespace vantor::analyze

#endif
