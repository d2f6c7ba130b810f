#ifndef VANTOR_BASEKIT_EDITDISTANCE_H
#define VANTOR_BASEKIT_EDITDISTANCE_H

#include <cstddef>
#include <string_view>

namespace BaseKit::impl {

// How many characters must be put in, taken out or replaced to turn one text into the other. Only
// the first 256 characters of each count: a command line can be of any length.
std::size_t EditDistance(std::string_view from, std::string_view to);

}  // namespace BaseKit::impl

#endif
