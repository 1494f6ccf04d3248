#pragma once

#include <string>
#include <vector>

// Applies the patch in patchDir with the updater's own applier to a
// temporary copy of oldDir and compares the result with newDir: the set of
// files and folders and every file's bytes. Returns one line per
// difference; empty when the patch does exactly what it should. The
// applier's own leftovers (its tempPatch folder, the progress record) are
// not counted. Throws Exception when the patch cannot be applied at all.
std::vector<std::string> VerifyPatch(const std::string& patchDir, const std::string& oldDir, const std::string& newDir);

// Lines naming what differs between two trees; empty when they are equal.
std::vector<std::string> CompareTrees(const std::string& actualDir, const std::string& expectedDir,
                                      const std::vector<std::string>& ignored = {});
