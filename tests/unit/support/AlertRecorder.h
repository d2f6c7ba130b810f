#ifndef VANTOR_SUPPORT_ALERTRECORDER_H
#define VANTOR_SUPPORT_ALERTRECORDER_H

#include <string>
#include <vector>

namespace vantor::support {

// How the double of the host's kernel-control library behaves.
enum class AlertBehaviour {
    Record,               // keeps the text
    ThrowStandard,        // refuses it with a standard exception
    ThrowOther,           // refuses it with something else
    ThrowOnConstruction,  // is not there at all
};

// The system alerts that were raised while this object lives; one at a time. A test program that
// compiles AlertRecorder.cc in raises alerts here and never on the machine: its definitions of the
// library's operations win over those of the shared library.
class AlertRecorder {
public:
    explicit AlertRecorder(AlertBehaviour behaviour = AlertBehaviour::Record);
    ~AlertRecorder();
    AlertRecorder(const AlertRecorder&) = delete;
    AlertRecorder& operator=(const AlertRecorder&) = delete;

    // The texts that were accepted, in order.
    std::vector<std::string> Texts() const;

    // How often the library was asked, refusals included.
    int Attempts() const;

    // Whether some thread held GlobalLock at the last attempt and was the one that asked.
    bool LockHeld() const;
};

}  // namespace vantor::support

#endif
