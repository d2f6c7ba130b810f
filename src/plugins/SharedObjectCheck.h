#ifndef VANTOR_PLUGINS_SHAREDOBJECTCHECK_H
#define VANTOR_PLUGINS_SHAREDOBJECTCHECK_H

#include <string>

namespace vantor {

// Looks at a file before the dynamic linker does and says why the linker must not be given it, or
// returns an empty text. Found are the files that would hang or kill the whole process: a FIFO, a
// socket or a device, whose opening can block for ever, and an ELF object of this machine's kind
// that was cut short, whose missing pages raise SIGBUS when the linker touches them. Every other
// file, good or bad, is the linker's to judge: it rejects those cleanly and in its own words. Never
// blocks. Format: elf(5).
std::string ReasonNotToLoad(const std::string& path);

}  // namespace vantor

#endif
