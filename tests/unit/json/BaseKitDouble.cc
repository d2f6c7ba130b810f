#include "json/BaseKitDouble.h"

#include <atomic>
#include <boost/make_shared.hpp>
#include <mutex>
#include <new>
#include <sstream>
#include <stdexcept>

#include "platform/BaseKit.h"

namespace vantor::support {

namespace {

struct Recording {
    std::mutex mutex;
    BaseKitDouble* active = nullptr;
    std::vector<std::string> calls;
    std::vector<GivenCommand> executed;
    std::atomic<int> objects{0};
    std::atomic<int> dispatchers{0};
};

Recording& TheRecording() {
    // Never destroyed: the program's dispatcher lives until the static destructors run.
    static auto* const recording = new Recording;
    return *recording;
}

BaseKitDouble* Note(const std::string& call) {
    Recording& recording = TheRecording();
    const std::lock_guard<std::mutex> guard(recording.mutex);
    recording.calls.push_back(call);
    return recording.active;
}

void Call(const std::string& call) {
    BaseKitDouble* const active = Note(call);
    if (active != nullptr && active->onCall) {
        active->onCall(call);
    }
}

BaseKitDouble& Active() {
    Recording& recording = TheRecording();
    const std::lock_guard<std::mutex> guard(recording.mutex);
    if (recording.active == nullptr) {
        throw std::logic_error("the command framework is used without a double of it");
    }
    return *recording.active;
}

std::string Joined(const std::list<std::string>& words) {
    std::string text;
    for (const std::string& word : words) {
        text += (text.empty() ? "" : " ") + word;
    }
    return text;
}

ParsedLine ParseWords(const std::string& line) {
    ParsedLine parsed;
    std::istringstream words(line);
    std::string word;
    while (words >> word) {
        parsed.path.push_back(word);
    }
    return parsed;
}

// Counts the framework's objects.
struct Counted {
    Counted() { ++TheRecording().objects; }
    ~Counted() { --TheRecording().objects; }
    Counted(const Counted&) = delete;
    Counted& operator=(const Counted&) = delete;
};

class RecordedInput : public BaseKit::AutoCli::CommandInput {
public:
    void AddParameter(const std::string& name, const std::string& value) override {
        Call("input: parameter " + name + "=" + value);
        given.parameters.emplace_back(name, value);
    }
    void SetCallerName(const std::string& name) override {
        Call("input: caller " + name);
        given.callerName = name;
    }
    void SetCommandPath(const std::list<std::string>& path) override {
        Call("input: path " + Joined(path));
        given.path = path;
    }

    GivenCommand given;

private:
    Counted counted;
};

class RecordedOutput : public BaseKit::AutoCli::CommandOutput {
public:
    bool HasErrors() const override {
        Call("output: has errors");
        return !errors.empty();
    }
    std::vector<std::string> GetErrorMessages() const override {
        Call("output: error messages");
        return errors;
    }

    std::vector<std::string> errors;

private:
    Counted counted;
};

// What the double keeps in the storage of a parser.
struct ParserState {
    Counted counted;
    ParsedLine parsed;
};

template <typename State>
State& In(unsigned char* storage) {
    return *std::launder(reinterpret_cast<State*>(storage));
}

template <typename State>
const State& In(const unsigned char* storage) {
    return *std::launder(reinterpret_cast<const State*>(storage));
}

[[noreturn]] void Unexpected(const std::string& operation) {
    throw std::logic_error("the program never calls " + operation);
}

}  // namespace

BaseKitDouble::BaseKitDouble()
    : parse(ParseWords), execute([](const GivenCommand&) { return std::vector<std::string>(); }) {
    Recording& recording = TheRecording();
    const std::lock_guard<std::mutex> guard(recording.mutex);
    recording.active = this;
    recording.calls.clear();
    recording.executed.clear();
    recording.objects = 0;
}

BaseKitDouble::~BaseKitDouble() {
    Recording& recording = TheRecording();
    const std::lock_guard<std::mutex> guard(recording.mutex);
    recording.active = nullptr;
}

std::vector<std::string> BaseKitDouble::Calls() const { return CallsOf(""); }

std::vector<std::string> BaseKitDouble::CallsOf(const std::string& object) const {
    Recording& recording = TheRecording();
    const std::lock_guard<std::mutex> guard(recording.mutex);
    std::vector<std::string> found;
    for (const std::string& call : recording.calls) {
        if (object.empty() || call.compare(0, object.size() + 1, object + ":") == 0) {
            found.push_back(call);
        }
    }
    return found;
}

std::vector<GivenCommand> BaseKitDouble::Executed() const {
    Recording& recording = TheRecording();
    const std::lock_guard<std::mutex> guard(recording.mutex);
    return recording.executed;
}

int BaseKitDouble::LiveObjects() const { return TheRecording().objects; }

int BaseKitDouble::LiveDispatchers() const { return TheRecording().dispatchers; }

}  // namespace vantor::support

namespace BaseKit::AutoCli {

using namespace vantor::support;

CommandParameters::~CommandParameters() = default;

CommandInput::~CommandInput() = default;

boost::shared_ptr<CommandInput> CommandInput::New() {
    Call("input: new");
    return boost::make_shared<RecordedInput>();
}

CommandResult::~CommandResult() = default;

CommandOutput::~CommandOutput() = default;

boost::shared_ptr<CommandOutput> CommandOutput::New() {
    Call("output: new");
    return boost::make_shared<RecordedOutput>();
}

OptionParser::OptionParser(const std::string& toolName) {
    static_assert(sizeof(ParserState) <= sizeof hostStorage);
    Call("parser: new " + toolName);
    new (hostStorage) ParserState;
}

OptionParser::~OptionParser() { In<ParserState>(hostStorage).~ParserState(); }

bool OptionParser::ParseString(const std::string& commandLine) {
    Call("parser: parse " + commandLine);
    ParsedLine& parsed = In<ParserState>(hostStorage).parsed;
    parsed = Active().parse(commandLine);
    return parsed.nothingToExecute;
}

std::vector<std::string> OptionParser::GetParseErrors() const {
    Call("parser: errors");
    return In<ParserState>(hostStorage).parsed.errors;
}

std::vector<std::pair<std::string, std::string>> OptionParser::GetCommandParameters() const {
    Call("parser: parameters");
    return In<ParserState>(hostStorage).parsed.parameters;
}

std::list<std::string> OptionParser::GetCommandPath() const {
    Call("parser: path");
    return In<ParserState>(hostStorage).parsed.path;
}

Dispatcher::Dispatcher() {
    Call("dispatcher: new");
    ++TheRecording().dispatchers;
}

Dispatcher::~Dispatcher() {
    const BaseKitDouble* const active = Note("dispatcher: destroyed");
    if (active != nullptr && active->onDestruction) {
        active->onDestruction();
    }
    --TheRecording().dispatchers;
}

bool Dispatcher::ExecuteCommand(boost::shared_ptr<CommandInput> input,
                                boost::shared_ptr<CommandOutput> output) {
    const GivenCommand given = dynamic_cast<RecordedInput&>(*input).given;
    {
        Recording& recording = TheRecording();
        const std::lock_guard<std::mutex> guard(recording.mutex);
        recording.executed.push_back(given);
    }
    Call("dispatcher: execute " + Joined(given.path));
    auto& recorded = dynamic_cast<RecordedOutput&>(*output);
    recorded.errors = Active().execute(given);
    return recorded.errors.empty();
}

void Dispatcher::AddExternalDirectory(const std::string& directory) {
    Call("dispatcher: directory " + directory);
}

std::string Dispatcher::FormatOutput(boost::shared_ptr<CommandOutput> /*output*/) {
    Unexpected("FormatOutput");
}

std::vector<std::pair<std::string, std::string>> Dispatcher::GetDefaultOutputFormatParameters() {
    Unexpected("GetDefaultOutputFormatParameters");
}

boost::shared_ptr<CommandNamespace> Dispatcher::GetRootNamespace() {
    Unexpected("GetRootNamespace");
}

bool Dispatcher::HasFormatter(const std::string& /*name*/) { Unexpected("HasFormatter"); }

boost::shared_ptr<OutputFormatter> Dispatcher::GetFormatter(const std::string& /*name*/) {
    Unexpected("GetFormatter");
}

std::vector<std::string> Dispatcher::GetFormatters() { Unexpected("GetFormatters"); }

void Dispatcher::AddPlugin(const std::string& /*name*/) { Unexpected("AddPlugin"); }

std::vector<std::string> Dispatcher::GetPluginNames() { Unexpected("GetPluginNames"); }

void Dispatcher::RegisterPlugin(const std::string& /*name*/) { Unexpected("RegisterPlugin"); }

void Dispatcher::AddDefaultDirectories() { Unexpected("AddDefaultDirectories"); }

void Dispatcher::ResetRegistrations() { Unexpected("ResetRegistrations"); }

boost::shared_ptr<CommandDescription>
Dispatcher::GetCommand(const std::list<std::string>& /*path*/) {
    Unexpected("GetCommand");
}

}  // namespace BaseKit::AutoCli
