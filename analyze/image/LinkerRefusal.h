#ifndef VANTOR_ANALYZE_IMAGE_LINKERREFUSAL_H
#define VANTOR_ANALYZE_IMAGE_LINKERREFUSAL_H

#include <string>

#include "image/Architecture.h"

namespace vantor::analyze {

// Why a boot could not load a shared object.
struct LinkerRefusal {
    enum class Kind {
        None,
        Refused,    // by the dynamic linker, in its own words
        Foreign,    // the same, for an object that is made for other machines
        Truncated,  // by the boot program, which finds that the file was cut short
    };

    Kind kind = Kind::None;
    std::string reason;  // without the path that the linker puts before its words
};

// Finds out from the headers of a file alone what a boot of that architecture would say of it, in
// the order in which the boot program and the GNU C library's dynamic linker look. What the linker
// needs other files for is not asked.
LinkerRefusal AskLinker(const std::string& content, const Architecture& boot);

}  // namespace vantor::analyze

#endif
