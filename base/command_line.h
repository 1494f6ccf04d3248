#pragma once

#include <string>
#include <vector>

// Splits a command line (without the program path) into words: blanks
// outside quotes separate words, a double quote toggles quoting and is
// dropped, "" gives an empty word, and backslashes are ordinary.
std::vector<std::string> SplitCommandLine(const std::string& text);

// The inverse, for building a command line from separate words: each word
// is quoted when it is empty or holds a blank, so SplitCommandLine gives
// the same words back (words holding a double quote cannot be carried).
std::string JoinCommandLine(const std::vector<std::string>& words);

// One word as another program's C runtime reads it back from a command
// line: as it is when it holds no blank and no double quote, else quoted,
// with each double quote and the backslashes before it (and before the
// closing quote) escaped. So a value can never become two arguments.
std::string QuoteArgument(const std::string& word);
// The C runtime's own reading of a command line (without the program):
// blanks outside quotes separate words, 2n backslashes before a double
// quote give n backslashes and the quote toggles quoting, 2n+1 give n and
// a literal quote; other backslashes are ordinary. The POSIX stand-in
// starts programs with these words, as a Windows program would see them.
std::vector<std::string> SplitArguments(const std::string& text);
