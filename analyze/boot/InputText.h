#ifndef VANTOR_ANALYZE_BOOT_INPUTTEXT_H
#define VANTOR_ANALYZE_BOOT_INPUTTEXT_H

#include <cstddef>
#include <string>

namespace vantor::analyze {

// The most that is read of a log or a drawing: far more than any boot leaves, and little enough for
// a 32-bit address space.
constexpr std::size_t longestInput = std::size_t{256} << 20U;

// The text of a file, or of whatever else can be read to its end, a pipe say. Throws
// std::runtime_error that names `path` and the reason when it cannot be read, or is longer than
// `limit` bytes.
std::string ReadInput(const std::string& path, std::size_t limit = longestInput);

// Throws what ReadInput() throws for too long a text.
[[noreturn]] void ThrowTooLong(const std::string& path, std::size_t limit);

}  // namespace vantor::analyze

#endif
