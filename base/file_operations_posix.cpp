#include <dirent.h>
#include <fcntl.h>
#include <sys/stat.h>
#include <sys/statvfs.h>
#include <unistd.h>

#include <cerrno>
#include <cstdio>
#include <filesystem>
#include <system_error>

#include "base/file_journal.h"
#include "base/file_operations.h"
#include "base/unique_handle_posix.h"

bool FileExists(const std::string& path) {
    struct stat info;
    return ::stat(path.c_str(), &info) == 0;
}

bool RemoveFile(const std::string& path) {
    struct stat info;
    if (::lstat(path.c_str(), &info) != 0 || S_ISDIR(info.st_mode)) return false;
    if (::unlink(path.c_str()) != 0) return false;
    if (IFileJournal* journal = GetFileJournal()) journal->RemovedFile(path);
    return true;
}

bool RenameFile(const std::string& from, const std::string& to) {
    // rename() would replace the target; the Windows move does not.
    if (FileExists(to)) return false;
    return MoveFileReplacing(from, to);
}

namespace {

// A move to another volume: a copy beside the destination, flushed, then
// renamed over it inside its own volume, then the source removed. The
// destination is never seen half written.
bool MoveAcrossVolumes(const std::string& from, const std::string& to) {
    const std::string copy = to + ".moving";
    const int in = ::open(from.c_str(), O_RDONLY | O_CLOEXEC | O_NOFOLLOW);
    if (in < 0) return false;
    const int out = ::open(copy.c_str(), O_WRONLY | O_CREAT | O_TRUNC | O_CLOEXEC | O_NOFOLLOW, 0644);
    bool copied = out >= 0;
    char buffer[65536];
    for (ssize_t count; copied && (count = ::read(in, buffer, sizeof buffer)) != 0;) {
        copied = count > 0 && ::write(out, buffer, static_cast<size_t>(count)) == count;
    }
    copied = copied && ::fsync(out) == 0;
    if (out >= 0) ::close(out);
    ::close(in);
    if (!copied || std::rename(copy.c_str(), to.c_str()) != 0) {
        ::unlink(copy.c_str());
        return false;
    }
    ::unlink(from.c_str());
    return true;
}

}  // namespace

bool MoveFileReplacing(const std::string& from, const std::string& to) {
    if (std::rename(from.c_str(), to.c_str()) != 0 && (errno != EXDEV || !MoveAcrossVolumes(from, to))) return false;
    if (IFileJournal* journal = GetFileJournal()) journal->Moved(from, to);
    return true;
}

void SyncFolder(const std::string& folder) {
    const UniqueFileDescriptor opened(
        ::open(folder.empty() ? "." : folder.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC));
    if (!opened) return;
    const bool synced = fsync(opened.Get()) == 0;
    if (IFileJournal* journal = GetFileJournal(); journal != nullptr && synced) journal->SyncedFolder(folder);
}

bool DeleteDirectory(const std::string& path, bool recursive) {
    if (path.empty()) return false;
    if (recursive) {
        std::error_code error;
        std::filesystem::remove_all(path, error);
        if (error) return false;
    } else if (::rmdir(path.c_str()) != 0) {
        return false;
    }
    if (IFileJournal* journal = GetFileJournal()) journal->RemovedDirectory(path);
    return true;
}

bool MakeDirectories(const std::string& path) {
    std::error_code error;
    std::filesystem::create_directories(path, error);
    if (!std::filesystem::is_directory(path, error)) return false;
    if (IFileJournal* journal = GetFileJournal()) journal->MadeDirectories(path);
    return true;
}

void CollectFiles(const std::string& folder, std::vector<std::string>& list) {
    UniqueDirectoryStream listing(::opendir(folder.c_str()));
    if (!listing) return;
    std::vector<std::string> subfolders;
    while (const dirent* entry = ::readdir(listing.Get())) {
        const std::string name = entry->d_name;
        if (name == "." || name == "..") continue;
        const std::string path = folder + "/" + name;
        struct stat info;
        // Links are not followed: nothing below the folder may lead out of it.
        if (::lstat(path.c_str(), &info) != 0) continue;
        if (S_ISDIR(info.st_mode)) {
            subfolders.push_back(path);
        } else {
            list.push_back(path);
        }
    }
    listing.Reset();
    for (const std::string& subfolder : subfolders) CollectFiles(subfolder, list);
}

bool GetFreeDiskSpace(const std::string& folder, int64_t& bytes) {
    struct statvfs info;
    if (::statvfs(folder.c_str(), &info) != 0) return false;
    bytes = static_cast<int64_t>(info.f_bavail) * static_cast<int64_t>(info.f_frsize);
    return true;
}

std::vector<std::string> ListFileNames(const std::string& folder) {
    std::vector<std::string> names;
    const UniqueDirectoryStream listing(::opendir(folder.c_str()));
    if (!listing) return names;
    while (const dirent* entry = ::readdir(listing.Get())) {
        struct stat info;
        const std::string name = entry->d_name;
        if (::lstat((folder + "/" + name).c_str(), &info) == 0 && S_ISREG(info.st_mode)) names.push_back(name);
    }
    return names;
}
