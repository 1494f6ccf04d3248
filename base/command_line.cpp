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

std::string QuoteArgument(const std::string& word) {
    if (!word.empty() && word.find_first_of(" \t\n\r\v\"") == std::string::npos) return word;
    std::string quoted = "\"";
    size_t backslashes = 0;
    for (const char c : word) {
        if (c == '\\') {
            ++backslashes;
            continue;
        }
        // Backslashes are special only before a quote.
        quoted.append(c == '"' ? 2 * backslashes + 1 : backslashes, '\\');
        quoted += c;
        backslashes = 0;
    }
    quoted.append(2 * backslashes, '\\');
    return quoted + "\"";
}

std::vector<std::string> SplitArguments(const std::string& text) {
    std::vector<std::string> words;
    bool inWord = false;
    bool quoted = false;
    size_t backslashes = 0;
    const auto append = [&](size_t count, char c) {
        if (!inWord) words.emplace_back();
        inWord = true;
        words.back().append(count, c);
    };
    for (const char c : text) {
        if (c == '\\') {
            ++backslashes;
            continue;
        }
        if (c == '"') {
            append(backslashes / 2, '\\');
            if (backslashes % 2 == 1) {
                append(1, '"');
            } else {
                append(0, '"');
                quoted = !quoted;
            }
        } else {
            if (backslashes > 0) append(backslashes, '\\');
            if (!quoted && IsBlank(c)) {
                inWord = false;
            } else {
                append(1, c);
            }
        }
        backslashes = 0;
    }
    if (backslashes > 0) append(backslashes, '\\');
    return words;
}
