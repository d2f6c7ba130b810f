#ifndef VANTOR_ANALYZE_VERIFY_CODES_H
#define VANTOR_ANALYZE_VERIFY_CODES_H

#include <string>

namespace vantor::analyze {

// What a finding's code stands for, in a sentence; empty for one that is not known. The manual page
// lists the same codes.
std::string DescribeCode(const std::string& code);

}  // namespace vantor::analyze

#endif
