#ifndef VANTOR_BASEKIT_SPAWNPROGRAM_H
#define VANTOR_BASEKIT_SPAWNPROGRAM_H

#include <sys/types.h>

#include <array>
#include <string>
#include <vector>

namespace BaseKit::impl {

// Starts arguments[0] in a child of its own and sets `process` to its id. `streams` become its
// standard input, output and error, and none of them is a standard descriptor of this process; it
// inherits no other descriptor, whoever opened it and however. Signals are as new: none blocked,
// none ignored. Returns 0 once the file is executed, or the errno value of what failed; there is
// then no child.
int SpawnProgram(std::vector<std::string>& arguments, const std::array<int, 3>& streams,
                 pid_t& process);

}  // namespace BaseKit::impl

#endif
