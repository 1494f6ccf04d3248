#include <gtest/gtest.h>
#include <unistd.h>

#include "state/system_facts.h"

namespace {

TEST(SystemFactsPosixTest, StandInsMatchTheirWindowsCounterparts) {
    EXPECT_EQ(GetProcessOwnerSid(), "S-1-22-1-" + std::to_string(::geteuid()));
    EXPECT_EQ(GetElevationType(), 0);
    EXPECT_FALSE(IsUacEnabled());
    if (::geteuid() == 0) {
        EXPECT_TRUE(IsAdministrator());
    }
    OsInfo record;
    DetectOsName(record);
    EXPECT_EQ(record.osName, "UnknownVersion");
}

}  // namespace
