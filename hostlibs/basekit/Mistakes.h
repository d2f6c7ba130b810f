#ifndef VANTOR_BASEKIT_MISTAKES_H
#define VANTOR_BASEKIT_MISTAKES_H

#include <stdexcept>
#include <string>
#include <vector>

namespace BaseKit::AutoCli {

// Thrown when a directory, or some of its files, cannot be used; what is good in it is known all
// the same. what() is all mistakes, with "; " between them.
class DescriptionError : public std::runtime_error {
public:
    // At least one mistake.
    explicit DescriptionError(std::vector<std::string> mistakesArg);
    ~DescriptionError() override;

    const std::vector<std::string>& Mistakes() const { return mistakes; }

private:
    std::vector<std::string> mistakes;
};

}  // namespace BaseKit::AutoCli

namespace BaseKit::impl {

// The mistakes found in one file, each "<file>: <place in it>: <reason>".
class Mistakes {
public:
    explicit Mistakes(std::string fileArg) : file(std::move(fileArg)) {}

    // `place` is a JSON pointer or a line and column; empty for the file as a whole.
    void Add(const std::string& place, const std::string& reason) {
        texts.push_back(file + ": " + (place.empty() ? "" : place + ": ") + reason);
    }

    const std::vector<std::string>& Texts() const { return texts; }

private:
    std::string file;
    std::vector<std::string> texts;
};

}  // namespace BaseKit::impl

#endif
