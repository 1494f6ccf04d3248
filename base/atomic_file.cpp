#include "base/atomic_file.h"

#include <algorithm>

#include "base/exception.h"
#include "base/file_operations.h"
#include "base/file_stream.h"
#include "base/paths.h"

namespace {

std::string TemporaryFor(const std::string& path) {
    const std::string name = "~" + GetFileName(path) + ".tmp";
    const std::string folder = GetParentDirectory(path);
    return folder.empty() ? name : PathJoin(folder, name);
}

}  // namespace

bool ReplaceFileAtomically(const std::string& path, const std::string& content) {
    return ReplaceFileAtomically(path, content, TemporaryFor(path));
}

void RemoveLeftoverReplacement(const std::string& path) { DiscardFile(TemporaryFor(path)); }

bool ReplaceFileAtomically(const std::string& path, const std::string& content, const std::string& temporaryPath) {
    try {
        FileStream file;
        file.Create(temporaryPath);
        size_t done = 0;
        while (done < content.size()) {
            const size_t piece = std::min<size_t>(content.size() - done, 1u << 30);
            done += file.Write(content.data() + done, static_cast<uint32_t>(piece));
        }
        file.Flush();
        file.Close();
    } catch (const Exception&) {
        DiscardFile(temporaryPath);
        return false;
    }
    if (!MoveFileReplacing(temporaryPath, path)) {
        DiscardFile(temporaryPath);
        return false;
    }
    SyncFolder(GetParentDirectory(path));
    return true;
}
