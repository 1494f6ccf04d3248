#pragma once

#include <cstdint>
#include <string>

// Writes progress records into folder over and over (action 0, 1, 2, ...,
// file "file-N") until the process is killed.
[[noreturn]] void WriteRecordsForever(const std::string& folder);

// A child process running WriteRecordsForever, killed without warning -
// the nearest a test gets to pulling the plug in the middle of a write.
class RecordWriterProcess {
public:
    explicit RecordWriterProcess(const std::string& folder);
    RecordWriterProcess(const RecordWriterProcess&) = delete;
    RecordWriterProcess& operator=(const RecordWriterProcess&) = delete;
    // Kills the child (if still running) and waits until it is gone.
    ~RecordWriterProcess();

private:
    intptr_t process;
};
