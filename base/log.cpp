#include "base/log.h"

#include "base/file_operations.h"
#include "base/local_time.h"
#include "base/log_file.h"
#include "base/paths.h"

namespace {

constexpr int64_t kMaximumLogSize = 5000000;

const char* LevelName(LogLevel level) {
    switch (level) {
        case LogLevel::Fatal:
            return "Fatal";
        case LogLevel::Warning:
            return "Warning";
        case LogLevel::Info:
            return "Info";
        case LogLevel::Trace:
            return "Trace";
        case LogLevel::Error:
            return "Error";
    }
    return "";
}

std::string BaseName(const std::string& path) {
    const size_t last = path.find_last_of("/\\");
    return last == std::string::npos ? path : path.substr(last + 1);
}

}  // namespace

namespace Log {

void Open(const std::string& name) {
    if (LogFile::IsOpen()) return;
    const std::string folder = GetTempDirectory();
    if (!MakeDirectories(folder)) return;
    const std::string path = PathJoin(folder, name);
    if (!LogFile::Open(path, false)) return;
    int64_t size = 0;
    if (LogFile::Size(size) && size > kMaximumLogSize) {
        LogFile::Close();
        // Not reopened: the run goes on without a log.
        static_cast<void>(LogFile::Open(path, true));
    }
}

void Close() { LogFile::Close(); }

bool IsOpen() { return LogFile::IsOpen(); }

std::string FormatLine(const std::string& sourceFile, const std::string& message, LogLevel level, int32_t line) {
    const LocalTime now = GetLocalTimeNow();
    std::ostringstream out;
    out << now.year << '-' << now.month << '-' << now.day << ' ' << now.hour << ':' << now.minute << ':' << now.second
        << '.' << now.milliseconds << ' ' << BaseName(sourceFile) << '(' << line << "): " << LevelName(level) << ": "
        << message << "\r\n";
    return out.str();
}

void Write(const std::string& sourceFile, const std::string& message, LogLevel level, int32_t line) {
    const std::string text = FormatLine(sourceFile, message, level, line);
    if (LogFile::IsOpen()) LogFile::Append(text);
}

}  // namespace Log

LogEntry::LogEntry(LogLevel entryLevel, const char* file, int32_t entryLine)
    : level(entryLevel), sourceFile(file), line(entryLine) {}

LogEntry::~LogEntry() {
    try {
        Log::Write(sourceFile, text.str(), level, line);
    } catch (...) {
        // A log line is never worth ending the program for.
    }
}
