#ifndef VANTOR_BASEKIT_OUTPUTFORMATTER_H
#define VANTOR_BASEKIT_OUTPUTFORMATTER_H

#include <string>

#include "platform/BaseKit.h"

namespace BaseKit::AutoCli {

// Turns the output of a command into text for a tool to show. May be used by many threads at once.
class OutputFormatter {
public:
    virtual ~OutputFormatter();
    virtual std::string Format(const CommandOutput& output) const = 0;
};

}  // namespace BaseKit::AutoCli

namespace BaseKit::impl {

// The formatter "text": what the command wrote on its standard output, as it stands.
class TextFormatter final : public AutoCli::OutputFormatter {
public:
    static constexpr const char* name = "text";
    std::string Format(const AutoCli::CommandOutput& output) const override;
};

}  // namespace BaseKit::impl

#endif
