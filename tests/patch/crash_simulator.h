#pragma once

#include <cstdint>
#include <map>
#include <memory>
#include <mutex>
#include <optional>
#include <string>
#include <vector>

#include "base/file_journal.h"

// A folder's content: relative paths ('/' separated) to file bytes, or to
// nullopt for a folder.
using FolderImage = std::map<std::string, std::optional<std::string>>;

FolderImage ReadFolderImage(const std::string& root);
// Empties root and writes image into it.
void WriteFolderImage(const std::string& root, const FolderImage& image);

// Records what the file layer changes below root during a run, then builds
// the states a power cut after any number of those changes could leave,
// in the spirit of ALICE and CrashMonkey: data not yet flushed to its file
// is lost or torn, and creations, moves and removals not yet synced to
// their folder are undone.
class CrashSimulator final : public IFileJournal {
public:
    // The tree below root as it is now is the durable starting point.
    explicit CrashSimulator(const std::string& root);
    ~CrashSimulator();

    void StartRecording();
    void StopRecording();
    size_t OperationCount() const { return operations.size(); }
    // Paths outside root that the run changed (none is allowed).
    const std::vector<std::string>& Outside() const { return outside; }

    // The distinct images a power cut after the first k operations could
    // leave; seed picks where unflushed writes are torn.
    std::vector<FolderImage> CrashStates(size_t k, uint32_t seed) const;

    void Created(const std::string& path, bool truncated) override;
    void Wrote(const std::string& path, int64_t offset, const void* data, uint32_t size) override;
    void Flushed(const std::string& path) override;
    void Moved(const std::string& from, const std::string& to) override;
    void RemovedFile(const std::string& path) override;
    void MadeDirectories(const std::string& path) override;
    void RemovedDirectory(const std::string& path) override;
    void SyncedFolder(const std::string& path) override;

    struct Operation {
        enum class Kind {
            Created,
            Truncated,
            Wrote,
            Flushed,
            Moved,
            RemovedFile,
            MadeDirectories,
            RemovedDirectory,
            Synced
        };
        Kind kind;
        std::string path;
        std::string target;  // Moved: the new path
        int64_t offset = 0;
        std::string data;
    };

private:
    void Add(Operation operation);
    bool Relative(const std::string& path, std::string& relative);

    std::string root;
    FolderImage initial;
    std::vector<Operation> operations;
    std::vector<std::string> outside;
    std::mutex mutex;
};
