#pragma once

#include <string>

// Replaces the file at path with content so that a crash or power cut at
// any moment leaves either the old file or the new one, never a torn mix:
// the content goes to a temporary file in the same folder, is flushed to
// disk, and then takes the old file's place in one rename. Returns false
// (leaving the old file as it was) when any step fails.
[[nodiscard]] bool ReplaceFileAtomically(const std::string& path, const std::string& content);

// A replacement cut short (a crash, a power cut) leaves its temporary file
// beside path; this removes it.
void RemoveLeftoverReplacement(const std::string& path);

// The same with the temporary name chosen by the caller (it must lie in the
// same folder as path).
[[nodiscard]] bool ReplaceFileAtomically(const std::string& path, const std::string& content,
                                         const std::string& temporaryPath);
