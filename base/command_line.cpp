#include "base/command_line.h"

namespace {
bool IsBlank(char c) { return c == '\t' || c == '\n' || c == '\r' || c == ' '; }
}  // namespace

std::vector<std::string> SplitCommandLine(const std::string& text) {
    std::vector<std::string> words;
    bool inWord = false;
    bool quoted = false;
    for (const char c : text) {
        if (c == '"') {
            if (!inWord) {
                words.emplace_back();
                inWord = true;
            }
            quoted = !quoted;
        } else if (!quoted && IsBlank(c)) {
            inWord = false;
        } else {
            if (!inWord) {
                words.emplace_back();
                inWord = true;
            }
            words.back() += c;
        }
    }
    return words;
}

std::string JoinCommandLine(const std::vector<std::string>& words) {
    std::string line;
    for (const std::string& word : words) {
        if (!line.empty()) line += ' ';
        bool needsQuotes = word.empty();
        for (const char c : word) needsQuotes = needsQuotes || IsBlank(c);
        line += needsQuotes ? "\"" + word + "\"" : word;
    }
    return line;
}
