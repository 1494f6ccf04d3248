#pragma once

#include <cstdint>
#include <string>
#include <vector>

// Japanese texts need a Japanese font, and which one a machine has varies:
// the dialogs and the main window each have a list of preferred faces,
// and the first one installed wins. Every other language keeps the
// dialogs' own font and the main window's embedded one.
struct FontCandidate {
    std::string faceName;
    int32_t height;  // logical units, the cell height given to the system
    int32_t weight;  // 400 normal, 700 bold
};

const std::vector<FontCandidate>& GetDialogFontCandidates();
const std::vector<FontCandidate>& GetMainWindowFontCandidates();

// The first candidate whose face name occurs, ignoring case, in one of the
// full names of the installed fonts ("Meiryo" is found in "Meiryo UI
// Bold"); null when none does.
const FontCandidate* ChooseFontCandidate(const std::vector<FontCandidate>& candidates,
                                         const std::vector<std::string>& installedFullNames);

// Whether the current language draws its texts with a font of the lists.
bool NeedsJapaneseFont();
