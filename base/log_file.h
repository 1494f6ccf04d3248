#pragma once

#include <cstdint>
#include <string>

// The OS side of the log: one exclusively opened file.
namespace LogFile {
// Opens path for writing, exclusively, creating it when missing; with
// truncate set any old contents are discarded. Returns false on failure.
[[nodiscard]] bool Open(const std::string& path, bool truncate);
void Close();
bool IsOpen();
// Size of the open file; false when it cannot be read.
[[nodiscard]] bool Size(int64_t& size);
// Appends the bytes at the end of the file with one write call.
void Append(const std::string& bytes);
}  // namespace LogFile
