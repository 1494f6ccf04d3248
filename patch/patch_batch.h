#pragma once

#include <cstdint>
#include <string>

// One patch or complete build, everything its two stages need to know:
// made once when the run decides what to install, then passed by value.
struct PatchBatch {
    std::string installationFolder;
    std::string patchFolder;         // the archives and the description arrive here
    std::string patchedFilesFolder;  // stage one builds the new files here
    std::string location;            // where the archives come from, kept in the record for a resume
    std::string version;             // the version the batch leads to
};

// Where an interrupted stage two starts again: the action its progress
// record names (-1: before the first), carried out once more.
struct ResumePoint {
    int32_t actionIndex = -1;
    std::string file;
};
