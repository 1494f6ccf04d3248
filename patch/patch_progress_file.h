#pragma once

#include <cstdint>
#include <string>

// The write-ahead record of a patch batch ("PPF.xml" in the installation
// folder): where the batch's archives and prepared files are, where they
// came from, which version it brings, and which action it was about to
// carry out. Rewritten before every deletion or directory action, so a run
// that finds it after an interruption repeats that action and goes on.
class PatchProgressFile {
public:
    PatchProgressFile() = default;
    PatchProgressFile(const PatchProgressFile&) = delete;
    PatchProgressFile& operator=(const PatchProgressFile&) = delete;
    virtual ~PatchProgressFile() = default;

    // The folder holding "PPF.xml" (and the temporary "_PPF.xml").
    void SetDirectory(const std::string& folder);

    // Looks for the record of an interrupted batch and loads it. False
    // when there is none; throws "Unrecoverable interrupted batch,
    // reinstall necessary." (ReinstallRequired) when what is there cannot
    // be read. Afterwards at most "PPF.xml" remains.
    bool Recover();
    // Reads one record file into the fields; throws "Failed to load
    // PatchProgressFile file." (and changes nothing) when it cannot.
    void LoadRecord(const std::string& path);
    // Writes the fields to "_PPF.xml", flushes it and renames it over
    // "PPF.xml", so a crash at any moment leaves one complete record.
    // A failure is logged at Error level and returns false.
    [[nodiscard]] bool WriteRecord();

    std::string GetRecordPath() const { return recordPath; }
    std::string GetAlternativeRecordPath() const { return alternativeRecordPath; }

    std::string GetPatchPath() const { return patchPath; }
    void SetPatchPath(const std::string& value) { patchPath = value; }
    std::string GetPatchedFilesPath() const { return patchedFilesPath; }
    void SetPatchedFilesPath(const std::string& value) { patchedFilesPath = value; }
    std::string GetPatchUri() const { return patchUri; }
    void SetPatchUri(const std::string& value) { patchUri = value; }
    std::string GetVersion() const { return version; }
    void SetVersion(const std::string& value) { version = value; }
    // The recorded action's ordinal in the batch; -1 before the first.
    int32_t GetActionIndex() const { return actionIndex; }
    void SetActionIndex(int32_t value) { actionIndex = value; }
    // The relative path the recorded action concerns.
    std::string GetFile() const { return file; }
    void SetFile(const std::string& value) { file = value; }

private:
    bool TryLoad(const std::string& path);

    std::string folder;
    std::string recordPath;
    std::string alternativeRecordPath;
    std::string patchPath;
    std::string patchedFilesPath;
    std::string patchUri;
    std::string version;
    int32_t actionIndex = -1;
    std::string file;
};
