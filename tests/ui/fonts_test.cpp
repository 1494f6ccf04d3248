// Which Japanese font the updater picks from the names of the installed fonts.

#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "ui/fonts.h"

namespace {

TEST(FontChoice, FirstCandidateFoundInAnInstalledFullName) {
    const struct {
        std::vector<std::string> installed;
        std::string face;  // empty: none
    } cases[] = {
        // A full name with more words after the face.
        {{"IPAGothic", "Meiryo UI Bold Italic"}, "Meiryo"},
        // The list's order wins over the order of enumeration, in any case.
        {{"MS UI Gothic", "ARIAL UNICODE MS"}, "Arial Unicode MS"},
        {{"IPAGothic", "@IPAPGothic", "Meiry"}, ""},
    };
    for (const auto& c : cases) {
        const FontCandidate* chosen = ChooseFontCandidate(GetDialogFontCandidates(), c.installed);
        EXPECT_EQ(chosen != nullptr ? chosen->faceName : "", c.face) << ::testing::PrintToString(c.installed);
    }
}

}  // namespace
