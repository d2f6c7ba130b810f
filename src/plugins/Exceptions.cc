#include "plugins/Exceptions.h"

#include <utility>

namespace vantor {

Exception::Exception(std::string text) : message(std::move(text)) {}

Exception::~Exception() = default;

const char* Exception::what() const noexcept { return message.c_str(); }

NotImplementedException::NotImplementedException(const std::string& method)
    : Exception("method `" + method + "' is not implemented") {}

InvalidPluginException::InvalidPluginException(const std::string& plugin, const std::string& reason)
    : Exception("plugin `" + plugin + "' is invalid: " + reason) {}

}  // namespace vantor
