#ifndef VANTOR_BASEKIT_TOKENIZER_H
#define VANTOR_BASEKIT_TOKENIZER_H

#include <string>
#include <string_view>
#include <vector>

namespace BaseKit::impl {

// The words of a line, or the sentence that says why it has none.
struct Tokens {
    std::vector<std::string> words;
    std::string error;  // empty: the words are good
};

// Splits a line at blanks, tabs and line ends with the quoting of a shell and nothing else of one:
//   '...'   everything as it stands;
//   "..."   as it stands, but a backslash before one of " \ $ ` is dropped, and so is a backslash
//           together with the line end after it;
//   \c      outside of quotes c, whatever it is; a backslash and the line end after it are dropped.
// Quoted and bare parts without a blank between them make one word; '' is an empty word.
Tokens Tokenize(std::string_view line);

// `word` so that Tokenize reads it as this one word: bare when it can be.
std::string QuoteWord(std::string_view word);

}  // namespace BaseKit::impl

#endif
