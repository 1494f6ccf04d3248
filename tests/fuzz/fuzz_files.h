#pragma once

#include <unistd.h>

#include <cstdint>
#include <cstdlib>
#include <string>

#include "base/exception.h"
#include "base/file_operations.h"
#include "base/file_stream.h"
#include "base/paths.h"

// Runs a parser on untrusted input: an Exception is a fine outcome, any other ending (a crash, a sanitizer report, a
// time-out) is a finding.
template <typename Action>
void ExpectNoCrash(Action action) {
    try {
        action();
    } catch (const Exception&) {
    }
}

// A folder of this fuzzing process for the files the loaders read.
inline const std::string& FuzzFolder() {
    static const std::string folder = PathJoin(GetTempDirectory(), "ivl-fuzz-" + std::to_string(getpid()));
    // Registered after the string exists, so it runs before the string goes.
    static const bool made = MakeDirectories(folder) && std::atexit([] { DeleteDirectory(FuzzFolder(), true); }) == 0;
    (void)made;
    return folder;
}

// Writes the input to a file of that folder and returns its path.
inline std::string WriteFuzzFile(const std::string& name, const uint8_t* data, size_t size) {
    const std::string path = PathJoin(FuzzFolder(), name);
    FileStream file;
    file.Create(path);
    if (size > 0) file.Write(data, static_cast<uint32_t>(size));
    return path;
}
