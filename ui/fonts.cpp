#include "ui/fonts.h"

#include "base/string_helpers.h"
#include "text/localization.h"

const std::vector<FontCandidate>& GetDialogFontCandidates() {
    static const std::vector<FontCandidate> candidates = {
        {"Meiryo", 15, 400},     {"Arial Unicode MS", 15, 400}, {"MS Gothic", 12, 400},
        {"MS PGothic", 12, 400}, {"MS UI Gothic", 12, 400},
    };
    return candidates;
}

const std::vector<FontCandidate>& GetMainWindowFontCandidates() {
    static const std::vector<FontCandidate> candidates = {
        {"Meiryo", 20, 700},     {"Arial Unicode MS", 18, 700}, {"MS Gothic", 14, 700},
        {"MS PGothic", 14, 700}, {"MS UI Gothic", 14, 700},
    };
    return candidates;
}

const FontCandidate* ChooseFontCandidate(const std::vector<FontCandidate>& candidates,
                                         const std::vector<std::string>& installedFullNames) {
    std::vector<std::string> installed;
    for (const std::string& name : installedFullNames) installed.push_back(ToLowerAscii(name));
    for (const FontCandidate& candidate : candidates) {
        const std::string face = ToLowerAscii(candidate.faceName);
        for (const std::string& name : installed) {
            if (name.find(face) != std::string::npos) return &candidate;
        }
    }
    return nullptr;
}

bool NeedsJapaneseFont() { return Localization::GetCurrentLanguage().name == "Japanese"; }
