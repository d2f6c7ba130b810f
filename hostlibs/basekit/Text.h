#ifndef VANTOR_BASEKIT_TEXT_H
#define VANTOR_BASEKIT_TEXT_H

#include <cstddef>
#include <string>
#include <string_view>
#include <vector>

// How error sentences name words, options and commands, and what words are made of.
namespace BaseKit::impl {

// Whether it is a letter of ASCII, whatever the locale.
bool IsLetter(char c);

// `text`, or when it is longer than `limit` bytes about as many of them, up to the end of a UTF-8
// character, and "...": a sentence must fit a line of a log.
std::string Shortened(std::string_view text, std::size_t limit);

// `text` in double quotes, shortened to 200 bytes.
std::string Quoted(std::string_view text);

// The words of a command line that parses to `path`, with blanks between them.
std::string JoinPath(const std::vector<std::string>& path);

// An option as it is typed, in quotes: "--name", or "-n" for a name of one letter.
std::string QuotedOption(std::string_view name);

// The C library's text for an errno value. May be called by many threads at once.
std::string ErrnoText(int error);

}  // namespace BaseKit::impl

#endif
