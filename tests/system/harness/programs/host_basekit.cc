// A command framework of a host's own: another build than ours, from declarations of its own. What
// must agree are names, the order of virtual operations, and that the classes which are inherited
// virtually hold no data (with data they would have virtual tables of their own); what else the
// objects hold does not matter. Each call adds a line to /tmp/host-framework.
#include <boost/make_shared.hpp>
#include <boost/shared_ptr.hpp>
#include <fstream>
#include <list>
#include <map>
#include <mutex>
#include <sstream>
#include <stdexcept>
#include <string>
#include <utility>
#include <vector>

namespace {

void Note(const std::string& line) {
    std::ofstream("/tmp/host-framework", std::ios::app) << line << '\n';
}

}  // namespace

namespace BaseKit::AutoCli {

class CommandParameters {
public:
    virtual ~CommandParameters() = default;
    virtual void AddParameter(const std::string& name, const std::string& value) = 0;
};

class CommandInput : public virtual CommandParameters {
public:
    static boost::shared_ptr<CommandInput> New();
    ~CommandInput() override = default;
    virtual void SetCallerName(const std::string& name) = 0;
    virtual void SetCommandPath(const std::list<std::string>& path) = 0;

protected:
    std::string caller;
};

class CommandResult {
public:
    virtual ~CommandResult() = default;
    virtual bool HasErrors() const = 0;
    virtual std::vector<std::string> GetErrorMessages() const = 0;
};

class CommandOutput : public virtual CommandResult {
public:
    static boost::shared_ptr<CommandOutput> New();
    ~CommandOutput() override = default;
    std::vector<std::string> errors;
};

class CommandNamespace;
class CommandDescription;
class OutputFormatter;

class OptionParser {
public:
    explicit OptionParser(const std::string& toolName);
    ~OptionParser();
    bool ParseString(const std::string& commandLine);
    std::vector<std::string> GetParseErrors() const;
    std::vector<std::pair<std::string, std::string>> GetCommandParameters() const;
    std::list<std::string> GetCommandPath() const;

private:
    std::string* tool;
    std::list<std::string> words;
    std::vector<std::pair<std::string, std::string>> options;
};

class Dispatcher {
public:
    Dispatcher();
    virtual ~Dispatcher();
    virtual bool ExecuteCommand(boost::shared_ptr<CommandInput> input,
                                boost::shared_ptr<CommandOutput> output);
    virtual std::string FormatOutput(boost::shared_ptr<CommandOutput> output);
    virtual std::vector<std::pair<std::string, std::string>> GetDefaultOutputFormatParameters();
    virtual boost::shared_ptr<CommandNamespace> GetRootNamespace();
    virtual bool HasFormatter(const std::string& name);
    virtual boost::shared_ptr<OutputFormatter> GetFormatter(const std::string& name);
    virtual std::vector<std::string> GetFormatters();
    virtual void AddExternalDirectory(const std::string& directory);
    virtual void AddPlugin(const std::string& name);
    virtual std::vector<std::string> GetPluginNames();
    virtual void RegisterPlugin(const std::string& name);
    virtual void AddDefaultDirectories();
    virtual void ResetRegistrations();
    virtual boost::shared_ptr<CommandDescription> GetCommand(const std::list<std::string>& path);

private:
    std::mutex mutex;
    std::vector<std::string> directories;
};

namespace {

class HostInput : public CommandInput {
public:
    void AddParameter(const std::string& name, const std::string& value) override {
        parameters[name] = value;
    }
    void SetCallerName(const std::string& name) override { caller = name; }
    void SetCommandPath(const std::list<std::string>& path) override { words = path; }

    std::string Text() const {
        std::string text = caller;
        for (const std::string& word : words) {
            text += " " + word;
        }
        for (const auto& [name, value] : parameters) {
            text += " " + name + "=" + value;
        }
        return text;
    }

private:
    std::list<std::string> words;
    std::map<std::string, std::string> parameters;
};

class HostOutput : public CommandOutput {
public:
    bool HasErrors() const override { return !errors.empty(); }
    std::vector<std::string> GetErrorMessages() const override { return errors; }
};

// The operations that the program inherits and never calls.
[[noreturn]] void NeverCalled() { throw std::logic_error("a call that nobody makes"); }

}  // namespace

boost::shared_ptr<CommandInput> CommandInput::New() { return boost::make_shared<HostInput>(); }

boost::shared_ptr<CommandOutput> CommandOutput::New() { return boost::make_shared<HostOutput>(); }

OptionParser::OptionParser(const std::string& toolName) : tool(new std::string(toolName)) {}

OptionParser::~OptionParser() { delete tool; }

// Words, and options "--name=value" behind them; "quiet" asks for nothing.
bool OptionParser::ParseString(const std::string& commandLine) {
    std::istringstream stream(commandLine);
    for (std::string word; stream >> word;) {
        if (const auto equals = word.find('='); equals != std::string::npos) {
            options.emplace_back(word.substr(2, equals - 2), word.substr(equals + 1));
        } else {
            words.push_back(word);
        }
    }
    Note(*tool + ": " + commandLine);
    return words.front() == "quiet";
}

std::vector<std::string> OptionParser::GetParseErrors() const {
    if (words.front() != "unknown") {
        return {};
    }
    return {"the host knows no '" + words.front() + "'", "the host helps nobody"};
}

std::vector<std::pair<std::string, std::string>> OptionParser::GetCommandParameters() const {
    return options;
}

std::list<std::string> OptionParser::GetCommandPath() const { return words; }

Dispatcher::Dispatcher() { Note("made"); }

Dispatcher::~Dispatcher() { Note("gone, with " + std::to_string(directories.size())); }

bool Dispatcher::ExecuteCommand(boost::shared_ptr<CommandInput> input,
                                boost::shared_ptr<CommandOutput> output) {
    const std::lock_guard<std::mutex> guard(mutex);
    const std::string text = dynamic_cast<HostInput&>(*input).Text();
    Note("executes for " + text);
    if (text.find("break") != std::string::npos) {
        output->errors = {"the host broke it", "and is sorry"};
    }
    return output->errors.empty();
}

void Dispatcher::AddExternalDirectory(const std::string& directory) {
    if (directory == "/usr/lib/nuvex/nvcli/ext") {
        throw std::runtime_error("the host refuses " + directory);
    }
    directories.push_back(directory);
}

std::string Dispatcher::FormatOutput(boost::shared_ptr<CommandOutput>) { NeverCalled(); }
std::vector<std::pair<std::string, std::string>> Dispatcher::GetDefaultOutputFormatParameters() {
    NeverCalled();
}
boost::shared_ptr<CommandNamespace> Dispatcher::GetRootNamespace() { NeverCalled(); }
bool Dispatcher::HasFormatter(const std::string&) { NeverCalled(); }
boost::shared_ptr<OutputFormatter> Dispatcher::GetFormatter(const std::string&) { NeverCalled(); }
std::vector<std::string> Dispatcher::GetFormatters() { NeverCalled(); }
void Dispatcher::AddPlugin(const std::string&) { NeverCalled(); }
std::vector<std::string> Dispatcher::GetPluginNames() { NeverCalled(); }
void Dispatcher::RegisterPlugin(const std::string&) { NeverCalled(); }
void Dispatcher::AddDefaultDirectories() { NeverCalled(); }
void Dispatcher::ResetRegistrations() { NeverCalled(); }
boost::shared_ptr<CommandDescription> Dispatcher::GetCommand(const std::list<std::string>&) {
    NeverCalled();
}

}  // namespace BaseKit::AutoCli
