#include <gtest/gtest.h>

#include <regex>

#include "base/exception.h"
#include "base/file_stream.h"
#include "base/log.h"
#include "base/paths.h"
#include "tests/support/test_files.h"

namespace {

const std::regex kTimeStamp(R"(^\d{4}-[1-9]\d?-[1-9]\d? (0|[1-9]\d?):(0|[1-9]\d?):(0|[1-9]\d?)\.(0|[1-9]\d{0,2}) )");

std::string AfterTimeStamp(const std::string& line) {
    std::smatch match;
    EXPECT_TRUE(std::regex_search(line, match, kTimeStamp)) << line;
    return match.suffix();
}

TEST(LogLineTest, FormatsEachPartUnpadded) {
    struct Case {
        const char* source;
        LogLevel level;
        const char* text;
        const char* expected;
    } cases[] = {
        {"one/two\\three.cpp", LogLevel::Info, "WinMain Enter", "three.cpp(17): Info: WinMain Enter\r\n"},
        {"plain", LogLevel::Error, "", "plain(17): Error: \r\n"},
        {".\\src\\x.cpp", static_cast<LogLevel>(3), "odd", "x.cpp(17): : odd\r\n"},
        {"Main", LogLevel::Trace, "a\nb", "Main(17): Trace: a\nb\r\n"},
        {"f", LogLevel::Fatal, "F", "f(17): Fatal: F\r\n"},
        {"w", LogLevel::Warning, "W", "w(17): Warning: W\r\n"},
    };
    for (const Case& c : cases) {
        EXPECT_EQ(AfterTimeStamp(Log::FormatLine(c.source, c.text, c.level, 17)), c.expected);
    }
}

class LogFileTest : public ::testing::Test {
protected:
    void SetUp() override {
        Log::Close();
        path = PathJoin(GetTempDirectory(), name);
        std::remove(path.c_str());
    }
    void TearDown() override {
        Log::Close();
        std::remove(path.c_str());
    }
    const std::string name =
        "ivl-log-test-" + std::to_string(::testing::UnitTest::GetInstance()->random_seed()) + ".log";
    std::string path;
};

TEST_F(LogFileTest, AppendsAcrossOpensAndDropsLinesWhileClosed) {
    Log::Open(name);
    LOG_AS("Main", Info) << "first " << 42;
    Log::Close();
    LOG_AS("Main", Info) << "dropped";
    Log::Open(name);
    Log::Open(name);  // already open: nothing happens
    LOG(Trace) << "second";
    Log::Close();
    const std::string text = ReadTextFile(path);
    EXPECT_NE(text.find("Main("), std::string::npos);
    EXPECT_NE(text.find("): Info: first 42\r\n"), std::string::npos);
    EXPECT_EQ(text.find("dropped"), std::string::npos);
    EXPECT_NE(text.find("log_test.cpp("), std::string::npos);
    EXPECT_NE(text.find("): Trace: second\r\n"), std::string::npos);
}

TEST_F(LogFileTest, StartsAfreshOnlyAboveFiveMillionBytes) {
    WriteTextFile(path, std::string(5000000, 'x'));
    Log::Open(name);
    LOG(Info) << "kept";
    Log::Close();
    EXPECT_GT(ReadTextFile(path).size(), 5000000u);

    WriteTextFile(path, std::string(5000001, 'x'));
    Log::Open(name);
    LOG(Info) << "fresh";
    Log::Close();
    const std::string text = ReadTextFile(path);
    ASSERT_LT(text.size(), 200u);
    EXPECT_EQ(AfterTimeStamp(text).find("log_test.cpp("), 0u);
}

TEST_F(LogFileTest, IsExclusiveBothWays) {
    {
        // Another holder of the file: the log stays closed and lines go nowhere.
        FileStream holder;
        holder.OpenForWrite(path);
        Log::Open(name);
        EXPECT_FALSE(Log::IsOpen());
        LOG(Info) << "lost";
    }
    EXPECT_EQ(ReadTextFile(path), "");
    // And while the log holds it, nobody else can open it.
    Log::Open(name);
    ASSERT_TRUE(Log::IsOpen());
    FileStream other;
    EXPECT_THROW(other.OpenForWrite(path), Exception);
}

TEST_F(LogFileTest, AnEntryLeftByAnExceptionIsStillWritten) {
    Log::Open(name);
    try {
        LogEntry entry(LogLevel::Error, "thrower", 5);
        entry.Stream() << "before the throw";
        throw std::runtime_error("x");
    } catch (const std::runtime_error&) {
    }
    Log::Close();
    EXPECT_NE(ReadTextFile(path).find("thrower(5): Error: before the throw"), std::string::npos);
}

}  // namespace
