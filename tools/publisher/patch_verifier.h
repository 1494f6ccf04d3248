#pragma once

#include <string>
#include <vector>

// Applies the patch in patchDir with the updater's own applier to a
// temporary copy of oldDir and compares the result with newDir: the set of
// files and folders and every file's bytes. Returns one line per
// difference; empty when the patch does exactly what it should (a
// leftover of the updater's own, such as its progress record, counts as a
// difference). Throws Exception when the patch cannot be applied at all.
std::vector<std::string> VerifyPatch(const std::string& patchDir, const std::string& oldDir, const std::string& newDir);

// Lines naming what differs between two trees; empty when they are equal.
std::vector<std::string> CompareTrees(const std::string& actualDir, const std::string& expectedDir);
