#include "base/paths.h"

namespace {

std::string Normalise(std::string text, char separator) {
    const char other = separator == '\\' ? '/' : '\\';
    for (char& c : text) {
        if (c == other) c = separator;
    }
    while (!text.empty() && (text.back() == '/' || text.back() == '\\')) text.pop_back();
    return text;
}

std::string WithPathSeparators(std::string path) {
    for (char& c : path) {
        if (c == '/' || c == '\\') c = kPathSeparator;
    }
    return path;
}

}  // namespace

std::string PathJoin(const std::string& base, const std::string& tail, char separator) {
    const std::string head = Normalise(base, separator);
    std::string rest = Normalise(tail, separator);
    const size_t start = rest.find_first_not_of("/\\");
    rest.erase(0, start == std::string::npos ? rest.size() : start);
    return head + separator + rest;
}

std::string GetParentDirectory(const std::string& path) {
    const std::string text = WithPathSeparators(path);
    const size_t last = text.rfind(kPathSeparator);
    return last == std::string::npos ? std::string() : text.substr(0, last);
}

std::string GetFileName(const std::string& path) {
    const std::string text = WithPathSeparators(path);
    const size_t last = text.rfind(kPathSeparator);
    return last == std::string::npos ? text : text.substr(last + 1);
}

std::string PathBelow(const std::string& path, const std::string& folder) {
    const std::string prefix = PathJoin(folder, "");
    const std::string full = PathJoin(path, "");
    if (full.size() <= prefix.size() || full.compare(0, prefix.size(), prefix) != 0) return "";
    return full.substr(prefix.size(), full.size() - prefix.size() - 1);
}
