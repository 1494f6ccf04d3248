#pragma once

#include <cstdint>
#include <string>

// What the file layer changes on disk, in order, for the crash tests: they
// record a whole run through a journal and then build every state a power
// cut could have left behind. The program itself never sets one, and with
// none set the file layer pays one pointer test per operation.
class IFileJournal {
public:
    // A file was created, or opened for writing (truncated: emptied).
    virtual void Created(const std::string& path, bool truncated) = 0;
    virtual void Wrote(const std::string& path, int64_t offset, const void* data, uint32_t size) = 0;
    // The file's data reached the disk.
    virtual void Flushed(const std::string& path) = 0;
    // A file was moved, replacing whatever was at the new path.
    virtual void Moved(const std::string& from, const std::string& to) = 0;
    virtual void RemovedFile(const std::string& path) = 0;
    // The folder and every missing parent were created.
    virtual void MadeDirectories(const std::string& path) = 0;
    // The folder was removed with everything in it.
    virtual void RemovedDirectory(const std::string& path) = 0;
    // The folder's entries (creations, moves, removals in it) reached the disk.
    virtual void SyncedFolder(const std::string& path) = 0;

protected:
    IFileJournal() = default;
    IFileJournal(const IFileJournal&) = default;
    IFileJournal& operator=(const IFileJournal&) = default;
    ~IFileJournal() = default;
};

// The process's journal, or null. Set it only while no other thread works
// on files; the journal is called from whichever thread does the work.
void SetFileJournal(IFileJournal* journal);
IFileJournal* GetFileJournal();
