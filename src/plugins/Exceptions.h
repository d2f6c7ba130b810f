#ifndef VANTOR_PLUGINS_EXCEPTIONS_H
#define VANTOR_PLUGINS_EXCEPTIONS_H

#include <exception>
#include <string>

namespace vantor {

// Base of the program's own failures. Holds the complete message, composed once by whoever throws;
// handlers catch std::exception and log what().
class Exception : public std::exception {
public:
    explicit Exception(std::string text);
    ~Exception() override;

    const char* what() const noexcept override;

private:
    std::string message;
};

// A plugin was asked for a method that its kind does not have.
class NotImplementedException : public Exception {
public:
    // `method` is the qualified name, as in "NativePlugin::ApplyHostProfile".
    explicit NotImplementedException(const std::string& method);
};

// A plugin file cannot be used.
class InvalidPluginException : public Exception {
public:
    // `plugin` is the file's path as the loader built it; `reason` says what is wrong with it.
    InvalidPluginException(const std::string& plugin, const std::string& reason);
};

}  // namespace vantor

#endif
