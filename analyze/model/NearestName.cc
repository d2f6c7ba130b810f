#include "model/NearestName.h"

#include <algorithm>
#include <bitset>
#include <numeric>

namespace vantor::analyze {

namespace {

std::string Fold(std::string text) {
    for (char& c : text) {
        if (c >= 'A' && c <= 'Z') {
            c = static_cast<char>(c - 'A' + 'a');
        }
    }
    return text;
}

std::uint64_t Letters(const std::string& folded) {
    std::uint64_t letters = 0;
    for (const char c : folded) {
        letters |= std::uint64_t{1} << (static_cast<unsigned char>(c) % 64);
    }
    return letters;
}

std::size_t AllowedSlips(std::size_t length) {
    return length < 3 ? 0 : std::min<std::size_t>(length / 3, 3);
}

// One slip makes a difference of two letters at most: one is gone, another is new.
bool MayBeWithin(std::uint64_t left, std::uint64_t right, std::size_t slips) {
    return std::bitset<64>(left ^ right).count() <= 2 * slips;
}

}  // namespace

std::size_t TypingDistance(std::string_view from, std::string_view to, std::size_t limit) {
    // Rows of the table of distances from the first i characters of `from` to the first j of `to`.
    std::vector<std::size_t> row(to.size() + 1);
    std::vector<std::size_t> above(to.size() + 1);
    std::vector<std::size_t> twoAbove;
    std::iota(row.begin(), row.end(), std::size_t{0});
    for (std::size_t i = 1; i <= from.size(); ++i) {
        twoAbove.swap(above);
        above.swap(row);
        row.assign(to.size() + 1, i);
        for (std::size_t j = 1; j <= to.size(); ++j) {
            const std::size_t replaced = above[j - 1] + (from[i - 1] == to[j - 1] ? 0 : 1);
            row[j] = std::min({replaced, above[j] + 1, row[j - 1] + 1});
            if (i > 1 && j > 1 && from[i - 1] == to[j - 2] && from[i - 2] == to[j - 1]) {
                row[j] = std::min(row[j], twoAbove[j - 2] + 1);
            }
        }
        if (*std::min_element(row.begin(), row.end()) > limit + 1) {
            break;  // a swap reaches back over one row, but adds one
        }
    }
    return std::min(row.back(), limit + 1);
}

NearestName::NearestName(const std::vector<std::string>& names, std::uint64_t limit) : left(limit) {
    for (const std::string& name : names) {
        if (name.size() <= longest) {
            const std::string folded = Fold(name);
            byLength[name.size()].push_back({folded, name, Letters(folded)});
        }
    }
}

std::string NearestName::Find(const std::string& unknown) {
    const std::size_t slips = AllowedSlips(unknown.size());
    const std::string folded = Fold(unknown);
    const std::uint64_t letters = Letters(folded);
    const std::size_t shortest = unknown.size() - std::min(unknown.size(), slips);
    std::string best;
    std::size_t bestDistance = slips + 1;
    for (std::size_t size = shortest; size <= std::min(longest, unknown.size() + slips); ++size) {
        for (const Known& known : byLength[size]) {
            if (known.name == unknown) {
                return {};
            }
            // A name that is out of the question costs as much as one character.
            const bool isNear = MayBeWithin(letters, known.letters, std::min(bestDistance, slips));
            const std::uint64_t cost = isNear ? (size + 1) * (unknown.size() + 1) : 1;
            if (left < cost) {
                return best;
            }
            left -= cost;
            const std::size_t distance =
                isNear ? TypingDistance(folded, known.folded, slips) : slips + 1;
            if (distance < bestDistance ||
                (distance == bestDistance && distance <= slips && known.name < best)) {
                best = known.name;
                bestDistance = distance;
            }
        }
    }
    return best;
}

}  // namespace vantor::analyze
