#include <sys/stat.h>

#include <boost/make_shared.hpp>
#include <cerrno>
#include <stdexcept>

#include "basekit/CommandExecution.h"
#include "basekit/CommandRegistry.h"
#include "basekit/HostStorage.h"
#include "basekit/OutputFormatter.h"
#include "platform/BaseKit.h"

// What this library makes of the operations that only its own tools call. A plugin of the
// dispatcher is a description file, named by its path, in a directory that is added or on its own;
// it stays known for good. Registering makes the commands of a known file executable, which adding
// does too, and a reset takes all commands away until then. The default directories are the host's
// four; one that does not exist is passed over. The one formatter is "text". All operations may be
// called by any number of threads at once.
namespace BaseKit::AutoCli {

using Storage = impl::HostStorage<impl::CommandRegistry>;

namespace {

// Where a host keeps the descriptions of its commands, as far as it has any.
constexpr const char* defaultDirectories[] = {
    "/usr/lib/nuvex/nvcli",
    "/usr/lib/nuvex/nvcli/int",
    "/usr/lib/nuvex/nvcli/int/ext",
    "/usr/lib/nuvex/nvcli/ext",
};

bool Exists(const char* path) {
    struct stat status {};
    return stat(path, &status) == 0 || errno != ENOENT;
}

template <typename Wanted, typename Given>
Wanted& OurOwn(const boost::shared_ptr<Given>& given, const char* message) {
    auto* const own = dynamic_cast<Wanted*>(given.get());
    if (own == nullptr) {
        throw std::invalid_argument(message);
    }
    return *own;
}

CommandAnswer& AnswerOf(const boost::shared_ptr<CommandOutput>& output) {
    return OurOwn<CommandAnswer>(output, "the output of a command comes from CommandOutput::New");
}

}  // namespace

Dispatcher::Dispatcher() { Storage::Put(hostStorage, std::make_unique<impl::CommandRegistry>()); }

Dispatcher::~Dispatcher() { Storage::Release(hostStorage); }

// The host library takes shared pointers by value.
// NOLINTBEGIN(performance-unnecessary-value-param)
bool Dispatcher::ExecuteCommand(boost::shared_ptr<CommandInput> input,
                                boost::shared_ptr<CommandOutput> output) {
    const auto& recorded = OurOwn<const impl::RecordedInput>(
        input, "the input of a command comes from CommandInput::New");
    CommandAnswer& answer = AnswerOf(output);
    impl::Execute(*Storage::In(hostStorage).Commands(), recorded, answer);
    return !answer.HasErrors();
}

std::string Dispatcher::FormatOutput(boost::shared_ptr<CommandOutput> output) {
    return GetFormatter(impl::TextFormatter::name)->Format(AnswerOf(output));
}
// NOLINTEND(performance-unnecessary-value-param)

std::vector<std::pair<std::string, std::string>> Dispatcher::GetDefaultOutputFormatParameters() {
    return {{"formatter", impl::TextFormatter::name}};
}

boost::shared_ptr<CommandNamespace> Dispatcher::GetRootNamespace() {
    return Storage::In(hostStorage).Commands()->Root();
}

bool Dispatcher::HasFormatter(const std::string& name) { return name == impl::TextFormatter::name; }

boost::shared_ptr<OutputFormatter> Dispatcher::GetFormatter(const std::string& name) {
    return HasFormatter(name) ? boost::make_shared<impl::TextFormatter>() : nullptr;
}

std::vector<std::string> Dispatcher::GetFormatters() { return {impl::TextFormatter::name}; }

void Dispatcher::AddExternalDirectory(const std::string& directory) {
    Storage::In(hostStorage).AddFiles(impl::ListDescriptionFiles(directory));
}

void Dispatcher::AddPlugin(const std::string& name) { Storage::In(hostStorage).AddFiles({name}); }

std::vector<std::string> Dispatcher::GetPluginNames() {
    return Storage::In(hostStorage).FileNames();
}

void Dispatcher::RegisterPlugin(const std::string& name) {
    Storage::In(hostStorage).Register(name);
}

void Dispatcher::AddDefaultDirectories() {
    std::vector<std::string> mistakes;
    for (const char* directory : defaultDirectories) {
        try {
            if (Exists(directory)) {
                AddExternalDirectory(directory);
            }
        } catch (const DescriptionError& error) {
            mistakes.insert(mistakes.end(), error.Mistakes().begin(), error.Mistakes().end());
        }
    }
    if (!mistakes.empty()) {
        throw DescriptionError(std::move(mistakes));
    }
}

void Dispatcher::ResetRegistrations() { Storage::In(hostStorage).Reset(); }

boost::shared_ptr<CommandDescription> Dispatcher::GetCommand(const std::list<std::string>& path) {
    const CommandPointer found =
        Storage::In(hostStorage).Commands()->Find({path.begin(), path.end()});
    return found == nullptr ? nullptr : boost::make_shared<CommandDescription>(*found);
}

}  // namespace BaseKit::AutoCli
