#pragma once

#include <cstdint>
#include <sstream>
#include <string>

enum class LogLevel : int32_t {
    Fatal = 1,
    Warning = 2,
    Info = 4,
    Trace = 8,
    Error = 16,
};

// The process-wide log file in the user's temporary folder. Every failure
// of the log stays inside it: the program never stops because of its log.
namespace Log {
// Opens (or creates) name in the temporary folder and appends to it. A file
// larger than 5,000,000 bytes is started afresh. Throws only when the
// temporary folder cannot be found.
void Open(const std::string& name);
void Close();
bool IsOpen();
// Formats one line and writes it with a single write call.
void Write(const std::string& sourceFile, const std::string& message, LogLevel level, int32_t line);
// The line as Write composes it (without writing), for tests.
std::string FormatLine(const std::string& sourceFile, const std::string& message, LogLevel level, int32_t line);
}  // namespace Log

// One log line, written when the entry goes out of scope (also when the
// scope is left by an exception).
class LogEntry {
public:
    LogEntry(LogLevel level, const char* sourceFile, int32_t line);
    LogEntry(const LogEntry&) = delete;
    LogEntry& operator=(const LogEntry&) = delete;
    ~LogEntry();

    std::ostringstream& Stream() { return text; }

private:
    LogLevel level;
    const char* sourceFile;
    int32_t line;
    std::ostringstream text;
};

// LOG(Info) << "text " << value;  -- the call site's file and line.
#define LOG(level) LogEntry(LogLevel::level, __FILE__, __LINE__).Stream()
// LOG_AS("Main", Info) << ...;  -- a fixed source tag instead of the file.
#define LOG_AS(tag, level) LogEntry(LogLevel::level, tag, __LINE__).Stream()
