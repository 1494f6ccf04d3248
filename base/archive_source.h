#pragma once

#include <string>

// How the patch applier waits for an archive that another component
// fetches (the downloader, on its own thread), so that unpacking can start
// on the first archive while later ones are still arriving.
enum class ArchiveState {
    Arrived,
    Cancelled,
    Failed,
    Corrupt,  // arrived, but not as the patch description declared it
};

class IArchiveSource {
public:
    // Blocks until the archive whose local file name is fileName has an
    // outcome. Cancelled when a stop was requested.
    virtual ArchiveState WaitForArchive(const std::string& fileName) = 0;
    // The stage needs no more archives (it failed): a wait in progress
    // ends at once. Nothing to do for a source that never waits long.
    virtual void Abandon() {}

protected:
    IArchiveSource() = default;
    IArchiveSource(const IArchiveSource&) = default;
    IArchiveSource& operator=(const IArchiveSource&) = default;
    ~IArchiveSource() = default;
};
