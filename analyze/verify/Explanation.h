#ifndef VANTOR_ANALYZE_VERIFY_EXPLANATION_H
#define VANTOR_ANALYZE_VERIFY_EXPLANATION_H

#include <ostream>
#include <string>

#include "model/BootModel.h"
#include "model/Finding.h"

namespace vantor::analyze {

// Tells in words of every plugin and of the barrier of a name: where it comes from, what it waits
// for and who waits for it, whether it runs and why not, and who would be left waiting for nothing
// were it disabled. `findings` are those of reading the plugins: of a name whose file was not
// loaded they say why. Throws std::runtime_error when there is nothing of that name; its text holds
// the nearest names. Headings are highlighted with `colour`.
void Explain(const BootModel& model, const Findings& findings, const std::string& name,
             std::ostream& stream, bool colour);

// What the error above says: that nothing has that name, and which names are near.
std::string UnknownName(const BootModel& model, const Findings& findings, const std::string& name);

}  // namespace vantor::analyze

#endif
