#ifndef VANTOR_ANALYZE_IMAGE_READFILES_H
#define VANTOR_ANALYZE_IMAGE_READFILES_H

#include <sys/stat.h>

#include <string>

namespace vantor::analyze {

// Which files this process has read, so that no result is written over what it was made from. One
// thread reads and asks.

void NoteRead(const struct stat& status);

// Whether the file at a path of this machine is one of them, under whatever name it was read.
bool WasRead(const std::string& path);

}  // namespace vantor::analyze

#endif
