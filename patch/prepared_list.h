#pragma once

#include <cstdint>
#include <map>
#include <string>
#include <vector>

// What stage one prepared, how large each file came out and its Adler-32,
// kept in the batch's patch folder (kPreparedListName), so that stage two,
// perhaps in a later process, can tell a complete set from one that lost
// files, and a moved file from the old one of the same size.
struct PreparedFile {
    int64_t size = -1;
    uint32_t checksum = 0;
};

// Lists items (relative paths) as prepared in patchedFilesFolder, durably;
// throws StepFailed when the list cannot be written.
void WritePreparedList(const std::string& patchFolder, const std::string& patchedFilesFolder,
                       const std::vector<std::string>& items);
// The list by item path; empty when there is none or it is not the
// program's own.
std::map<std::string, PreparedFile> ReadPreparedList(const std::string& patchFolder);
