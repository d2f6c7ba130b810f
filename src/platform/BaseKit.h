#ifndef VANTOR_PLATFORM_BASEKIT_H
#define VANTOR_PLATFORM_BASEKIT_H

#include <boost/shared_ptr.hpp>
#include <cstddef>
#include <list>
#include <string>
#include <utility>
#include <vector>

// The operations of libbasekit, the host's command framework, that this system calls. The library
// belongs to the host; hostlibs/ has a working one for every other machine. It knows commands from
// description files, and runs them; nothing here tells how.
namespace BaseKit::AutoCli {

// The parameters of a command: (name, value) pairs in command-line order.
class CommandParameters {
public:
    virtual ~CommandParameters();
    virtual void AddParameter(const std::string& name, const std::string& value) = 0;
};

// What one execution of a command is told. Used by one thread.
class CommandInput : public virtual CommandParameters {
public:
    // A fresh, empty input.
    static boost::shared_ptr<CommandInput> New();

    ~CommandInput() override;
    // The name of the program that issues the command.
    virtual void SetCallerName(const std::string& name) = 0;
    // The namespace words and, last, the command word.
    virtual void SetCommandPath(const std::list<std::string>& path) = 0;
};

// The outcome of a command.
class CommandResult {
public:
    virtual ~CommandResult();
    virtual bool HasErrors() const = 0;
    // Sentences for people, in the order in which they came up; empty without errors.
    virtual std::vector<std::string> GetErrorMessages() const = 0;
};

// What one execution of a command answers. Used by one thread.
class CommandOutput : public virtual CommandResult {
public:
    // A fresh, empty output.
    static boost::shared_ptr<CommandOutput> New();

    ~CommandOutput() override;
};

// Parses command lines of a management tool, without the tool's own name. Used by one thread.
class OptionParser {
public:
    explicit OptionParser(const std::string& toolName);
    ~OptionParser();
    OptionParser(const OptionParser&) = delete;
    OptionParser& operator=(const OptionParser&) = delete;

    // Parses one line. True: there is nothing to execute (the line is blank or asks for help).
    // False: look at the errors and, without any, at the path and the parameters.
    bool ParseString(const std::string& commandLine);

    // Sentences, one for each error; empty when the line is a valid command.
    std::vector<std::string> GetParseErrors() const;

    // The options as (name, value) pairs, in command-line order.
    std::vector<std::pair<std::string, std::string>> GetCommandParameters() const;

    // The words before the first option: namespace words and the command word.
    std::list<std::string> GetCommandPath() const;

private:
    // The caller provides the storage but does not know the host library's layout: room for any
    // plausible one, so that another build of the library fits without a rebuild of the program.
    [[maybe_unused]] alignas(std::max_align_t) unsigned char hostStorage[512];
};

class CommandNamespace;
class CommandDescription;
class OutputFormatter;

// Knows the commands of the directories that it has been given and executes them. Directories are
// added by one thread; commands may then be executed by many at once. The virtual operations stand
// in the order of the host library's virtual table, because the system calls through it; only
// ExecuteCommand and AddExternalDirectory are ever called.
class Dispatcher {
public:
    Dispatcher();
    virtual ~Dispatcher();
    Dispatcher(const Dispatcher&) = delete;
    Dispatcher& operator=(const Dispatcher&) = delete;

    // Executes the command that `input` describes and writes results and errors to `output`.
    // Returns whether it succeeded. May throw.
    virtual bool ExecuteCommand(boost::shared_ptr<CommandInput> input,
                                boost::shared_ptr<CommandOutput> output);

    virtual std::string FormatOutput(boost::shared_ptr<CommandOutput> output);
    virtual std::vector<std::pair<std::string, std::string>> GetDefaultOutputFormatParameters();
    virtual boost::shared_ptr<CommandNamespace> GetRootNamespace();
    virtual bool HasFormatter(const std::string& name);
    virtual boost::shared_ptr<OutputFormatter> GetFormatter(const std::string& name);
    virtual std::vector<std::string> GetFormatters();

    // Makes the commands described in `directory` known. Throws an exception derived from
    // std::exception when the directory, or a file in it, cannot be used.
    virtual void AddExternalDirectory(const std::string& directory);

    virtual void AddPlugin(const std::string& name);
    virtual std::vector<std::string> GetPluginNames();
    virtual void RegisterPlugin(const std::string& name);
    virtual void AddDefaultDirectories();
    virtual void ResetRegistrations();
    virtual boost::shared_ptr<CommandDescription> GetCommand(const std::list<std::string>& path);

private:
    // As in OptionParser; a class that derives from this one must not overlay the host's data.
    [[maybe_unused]] alignas(std::max_align_t) unsigned char hostStorage[1024];
};

}  // namespace BaseKit::AutoCli

#endif
