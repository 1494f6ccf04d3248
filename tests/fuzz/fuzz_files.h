#pragma once

#include <cstdint>
#include <cstdlib>
#include <string>

#include "base/paths.h"
#include "tests/support/test_files.h"

// Runs a parser on untrusted input: an Exception is a fine outcome, any other ending (a crash, a sanitizer report, a
// time-out) is a finding.
template <typename Action>
void ExpectNoCrash(Action action) {
    ErrorOf(action);
}

// A folder of this fuzzing process for the files the loaders read, removed when the process ends.
inline const std::string& FuzzFolder() {
    static const TempFolder folder;
    return folder.Path();
}

// Writes the input to a file of that folder and returns its path.
inline std::string WriteFuzzFile(const std::string& name, const uint8_t* data, size_t size) {
    WriteTextFile(PathJoin(FuzzFolder(), name), std::string(reinterpret_cast<const char*>(data), size));
    return PathJoin(FuzzFolder(), name);
}
