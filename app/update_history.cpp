#include "app/update_history.h"

#include "base/exception.h"
#include "base/file_stream.h"
#include "base/paths.h"

std::string FormatHistoryLine(const LocalTime& time, const std::string& location) {
    return std::to_string(time.year) + "-" + std::to_string(time.month) + "-" + std::to_string(time.day) + " " +
           std::to_string(time.hour) + ":" + std::to_string(time.minute) + ":" + std::to_string(time.second) + "." +
           std::to_string(time.milliseconds) + " " + location + "\r\n";
}

void AppendUpdateHistory(const std::string& installDir, const std::string& location) {
    try {
        FileStream history;
        history.OpenForWrite(PathJoin(installDir, "UpdateHistory.log"));
        history.Seek(0, 2);
        const std::string line = FormatHistoryLine(GetLocalTimeNow(), location);
        history.Write(line.data(), static_cast<uint32_t>(line.size()));
        history.Flush();
    } catch (const Exception&) {
        // The history is a courtesy; the update stands without it.
    }
}
