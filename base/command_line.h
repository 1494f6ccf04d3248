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
