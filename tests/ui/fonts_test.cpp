// Which Japanese font the updater picks from the names of the installed
// fonts.

#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "ui/fonts.h"

namespace {

TEST(FontChoice, FirstCandidateFoundInAnInstalledFullName) {
    struct Case {
        std::vector<std::string> installed;
        std::string face;  // empty: none
        int32_t height;
    };
    const Case cases[] = {
        // A full name with more words after the face, in any case.
        {{"IPAGothic", "Meiryo UI Bold Italic"}, "Meiryo", 15},
        {{"MEIRYO"}, "Meiryo", 15},
        // The list's order wins over the order of enumeration.
        {{"MS UI Gothic", "Arial Unicode MS"}, "Arial Unicode MS", 15},
        {{"MS PGothic"}, "MS PGothic", 12},
        {{"@MS UI Gothic"}, "MS UI Gothic", 12},
        {{"IPAGothic", "@IPAPGothic", "Meiry"}, "", 0},
        {{}, "", 0},
    };
    for (const Case& c : cases) {
        const FontCandidate* chosen = ChooseFontCandidate(GetDialogFontCandidates(), c.installed);
        if (c.face.empty()) {
            EXPECT_EQ(chosen, nullptr) << ::testing::PrintToString(c.installed);
        } else {
            ASSERT_NE(chosen, nullptr) << ::testing::PrintToString(c.installed);
            EXPECT_EQ(chosen->faceName, c.face);
            EXPECT_EQ(chosen->height, c.height);
        }
    }
    const FontCandidate* bold = ChooseFontCandidate(GetMainWindowFontCandidates(), {"Meiryo"});
    ASSERT_NE(bold, nullptr);
    EXPECT_EQ(bold->height, 20);
    EXPECT_EQ(bold->weight, 700);
}

}  // namespace
