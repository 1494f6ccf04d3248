#include <gtest/gtest.h>

#include <regex>
#include <tuple>

#include "base/exception.h"
#include "base/file_stream.h"
#include "base/log.h"
#include "base/paths.h"
#include "tests/support/test_files.h"

namespace {

// Date and time without leading zeros.
const std::string kStamp = R"(\d{4}-[1-9]\d?-[1-9]\d? ([1-9]?\d):([1-9]?\d):([1-9]?\d)\.([1-9]?\d{0,2}) )";

TEST(LogTest, FormatsEachPartUnpadded) {
    const std::tuple<const char*, const char*, LogLevel, const char*> cases[] = {
        {"one/two\\three.cpp", "WinMain Enter", LogLevel::Info, "three.cpp(17): Info: WinMain Enter\r\n"},
        {"plain", "", LogLevel::Error, "plain(17): Error: \r\n"},
        {"x", "odd", static_cast<LogLevel>(3), "x(17): : odd\r\n"},
        {"Main", "a\nb", LogLevel::Trace, "Main(17): Trace: a\nb\r\n"},
        {"f", "F", LogLevel::Fatal, "f(17): Fatal: F\r\n"},
        {"w", "W", LogLevel::Warning, "w(17): Warning: W\r\n"},
    };
    for (const auto& [source, text, level, expected] : cases) {
        std::smatch stamp;
        const std::string line = Log::FormatLine(source, text, level, 17);
        ASSERT_TRUE(std::regex_search(line, stamp, std::regex("^" + kStamp))) << line;
        EXPECT_EQ(stamp.suffix(), expected);
    }
}

// A log name in a fresh folder of the temporary folder, where the log lives.
struct LogFolder : TempFolder {
    ~LogFolder() { Log::Close(); }
    const std::string name = PathJoin(GetFileName(Path()), "test.log");
    const std::string path = *this / "test.log";
};

TEST(LogFileTest, AppendsUpToFiveMillionBytesThenStartsAfreshAndIsExclusiveBothWays) {
    for (const size_t size : {5000000u, 5000001u}) {
        LogFolder log;
        WriteTextFile(log.path, std::string(size, 'x'));
        Log::Open(log.name);
        Log::Open(log.name);  // already open: nothing happens
        LOG(Info) << "first " << 42;
        Log::Close();
        LOG(Info) << "dropped while closed";
        const size_t kept = size == 5000000u ? size : 0;
        EXPECT_TRUE(std::regex_match(ReadTextFile(log.path).substr(kept),
                                     std::regex(kStamp + R"(log_test.cpp\(\d+\): Info: first 42\r\n)")));
    }
    LogFolder log;
    {
        // Another holder of the file: the log stays closed and lines go nowhere.
        FileStream holder;
        holder.OpenForWrite(log.path);
        Log::Open(log.name);
        EXPECT_FALSE(Log::IsOpen());
        LOG(Info) << "lost";
    }
    EXPECT_EQ(ReadTextFile(log.path), "");
    // And while the log holds it, nobody else can open it.
    Log::Open(log.name);
    ASSERT_TRUE(Log::IsOpen());
    FileStream other;
    EXPECT_THROW(other.OpenForWrite(log.path), Exception);
}

}  // namespace
