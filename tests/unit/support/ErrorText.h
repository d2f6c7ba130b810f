#ifndef VANTOR_SUPPORT_ERRORTEXT_H
#define VANTOR_SUPPORT_ERRORTEXT_H

#include <exception>
#include <string>

namespace vantor::support {

// The whole text of the exception of type E that the action throws; a remark that no message looks
// like when it throws nothing or something else.
template <typename E, typename Action>
std::string ErrorText(Action action) {
    try {
        action();
    } catch (const E& exception) {
        return exception.what();
    } catch (const std::exception& exception) {
        return std::string("(another exception) ") + exception.what();
    }
    return "(no exception)";
}

}  // namespace vantor::support

#endif
