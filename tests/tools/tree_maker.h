#pragma once

#include <cstdint>
#include <string>

// Seeded game trees for round trips: folders a few levels deep holding text
// and binary files of varied sizes, and a next version of the same tree
// with files edited, added and removed, folders added (some empty) and
// removed, and a file and a folder trading places.
void MakeRandomTree(uint32_t seed, const std::string& root);
void MakeNextVersion(uint32_t seed, const std::string& oldRoot, const std::string& newRoot);

// True when the xdelta3 program can be run from here (not under Wine).
bool CanRunXdelta3();
