#include "patch/prepared_list.h"

#include <algorithm>

#include "base/atomic_file.h"
#include "base/exception.h"
#include "base/file_stream.h"
#include "base/path_kind.h"
#include "base/paths.h"
#include "base/record_names.h"
#include "patch/checksum.h"

// One line per file: size, checksum, the item's path, tab-separated (item
// paths hold no control characters).
void WritePreparedList(const std::string& patchFolder, const std::string& patchedFilesFolder,
                       const std::vector<std::string>& items) {
    std::string list;
    for (const std::string& item : items) {
        const std::string prepared = PathJoin(patchedFilesFolder, item);
        list +=
            std::to_string(FileSizeOf(prepared)) + "\t" + std::to_string(ChecksumOfFile(prepared)) + "\t" + item + "\n";
    }
    const std::string path = PathJoin(patchFolder, kPreparedListName);
    if (!ReplaceFileAtomically(path, list)) throw Exception("Failed to write " + path, ErrorCode::StepFailed);
}

std::map<std::string, PreparedFile> ReadPreparedList(const std::string& patchFolder) {
    std::map<std::string, PreparedFile> files;
    std::string text;
    if (!ReadFileBytes(PathJoin(patchFolder, kPreparedListName), 64 * 1024 * 1024, text)) return files;
    const auto number = [](const std::string& digits, int64_t& value) {
        if (digits.empty() || digits.size() > 18 || digits.find_first_not_of("0123456789") != std::string::npos) {
            return false;
        }
        value = std::stoll(digits);
        return true;
    };
    for (size_t start = 0; start < text.size();) {
        const size_t end = std::min(text.find('\n', start), text.size());
        const std::string line = text.substr(start, end - start);
        const size_t first = line.find('\t');
        const size_t second = first == std::string::npos ? first : line.find('\t', first + 1);
        PreparedFile file;
        int64_t checksum = 0;
        if (second == std::string::npos || !number(line.substr(0, first), file.size) ||
            !number(line.substr(first + 1, second - first - 1), checksum)) {
            return {};
        }
        file.checksum = static_cast<uint32_t>(checksum);
        files[line.substr(second + 1)] = file;
        start = end + 1;
    }
    return files;
}
