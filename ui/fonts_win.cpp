#include <windows.h>

#include "ui/fonts_win.h"

#include <mutex>

#include "base/log.h"
#include "resources/resource_ids.h"
#include "text/program_resource.h"

namespace {

// Made once, kept until the process ends. The main thread and the UI
// thread both ask for the dialog font, hence the lock.
struct FontCache {
    std::mutex mutex;
    UniqueFont dialogFont;
    UniqueFont mainWindowSystemFont;
    std::unique_ptr<Gdiplus::Font> mainWindowFont;
};

FontCache& Cache() {
    static FontCache cache;
    return cache;
}

int CALLBACK CollectFontName(const LOGFONTA* logFont, const TEXTMETRICA*, DWORD, LPARAM names) {
    const auto* font = reinterpret_cast<const ENUMLOGFONTEXA*>(logFont);
    const std::string name = reinterpret_cast<const char*>(font->elfFullName);
    LOG(Trace) << "Enum font: " << name;
    reinterpret_cast<std::vector<std::string>*>(names)->push_back(name);
    return 1;
}

UniqueFont MakeFont(const std::string& faceName, int32_t height, int32_t weight) {
    LOGFONTA description = {};
    description.lfHeight = height;
    description.lfWeight = weight;
    description.lfCharSet = SHIFTJIS_CHARSET;
    lstrcpynA(description.lfFaceName, faceName.c_str(), LF_FACESIZE);
    return UniqueFont(CreateFontIndirectA(&description));
}

}  // namespace

UniqueFont CreateBestFont(const std::vector<FontCandidate>& candidates, int32_t defaultHeight, int32_t defaultWeight) {
    const UniqueScreenDc screen(GetDC(nullptr));
    LOGFONTA query = {};
    query.lfCharSet = SHIFTJIS_CHARSET;
    std::vector<std::string> installed;
    EnumFontFamiliesExA(screen.Get(), &query, CollectFontName, reinterpret_cast<LPARAM>(&installed), 0);
    UniqueFont font;
    if (!installed.empty()) {
        const FontCandidate* chosen = ChooseFontCandidate(candidates, installed);
        if (chosen != nullptr) font = MakeFont(chosen->faceName, chosen->height, chosen->weight);
        if (!font) font = MakeFont("", defaultHeight, defaultWeight);
    }
    if (font) {
        // The face the system really gave us, which for an empty name is
        // its own choice.
        char face[LF_FACESIZE] = {};
        HGDIOBJ previous = SelectObject(screen.Get(), font.Get());
        GetTextFaceA(screen.Get(), LF_FACESIZE, face);
        SelectObject(screen.Get(), previous);
        LOG(Info) << "Created font: " << face;
    }
    return font;
}

HFONT GetDialogFont() {
    if (!NeedsJapaneseFont()) return nullptr;
    FontCache& cache = Cache();
    std::lock_guard<std::mutex> lock(cache.mutex);
    if (!cache.dialogFont) {
        LOG(Trace) << "Finding dialog font...";
        cache.dialogFont = CreateBestFont(GetDialogFontCandidates(), 14, 400);
    }
    return cache.dialogFont.Get();
}

Gdiplus::Font* GetMainWindowFont() {
    if (!NeedsJapaneseFont()) return nullptr;
    FontCache& cache = Cache();
    std::lock_guard<std::mutex> lock(cache.mutex);
    if (cache.mainWindowFont == nullptr) {
        LOG(Trace) << "Finding main window font...";
        cache.mainWindowSystemFont = CreateBestFont(GetMainWindowFontCandidates(), 24, 700);
        const UniqueScreenDc screen(GetDC(nullptr));
        LOGFONTA description = {};
        if (cache.mainWindowSystemFont &&
            GetObjectA(cache.mainWindowSystemFont.Get(), sizeof(description), &description) != 0) {
            cache.mainWindowFont = std::make_unique<Gdiplus::Font>(screen.Get(), &description);
        } else {
            cache.mainWindowFont = std::make_unique<Gdiplus::Font>(screen.Get());
        }
    }
    return cache.mainWindowFont.get();
}

void DeleteFonts() {
    FontCache& cache = Cache();
    std::lock_guard<std::mutex> lock(cache.mutex);
    cache.dialogFont.Reset();
    cache.mainWindowSystemFont.Reset();
    cache.mainWindowFont.reset();
}

void ApplyDialogFont(HWND window) {
    HFONT font = GetDialogFont();
    if (font == nullptr) return;
    SendMessageW(window, WM_SETFONT, reinterpret_cast<WPARAM>(font), TRUE);
    SendToDescendants(window, WM_SETFONT, reinterpret_cast<WPARAM>(font), TRUE, true);
}

void SendToDescendants(HWND window, UINT message, WPARAM wParam, LPARAM lParam, bool recursive) {
    for (HWND child = GetWindow(window, GW_CHILD); child != nullptr; child = GetWindow(child, GW_HWNDNEXT)) {
        SendMessageW(child, message, wParam, lParam);
        if (recursive) SendToDescendants(child, message, wParam, lParam, true);
    }
}

MainWindowFont CreateMainWindowFont() {
    MainWindowFont result;
    result.font = GetMainWindowFont();
    if (result.font != nullptr) return result;
    ResourceBytes bytes;
    if (!FindProgramResource(MAKEINTRESOURCEA(IDR_EMBEDDED_FONT), MAKEINTRESOURCEA(10), bytes)) return result;
    result.collection = std::make_unique<Gdiplus::PrivateFontCollection>();
    result.collection->AddMemoryFont(bytes.data, static_cast<INT>(bytes.size));
    if (result.collection->GetFamilyCount() < 1) return result;
    Gdiplus::FontFamily family;
    INT found = 0;
    result.collection->GetFamilies(1, &family, &found);
    if (found < 1) return result;
    result.ownFont = std::make_unique<Gdiplus::Font>(&family, 11.0f, Gdiplus::FontStyleBold, Gdiplus::UnitPoint);
    if (result.ownFont->IsAvailable()) result.font = result.ownFont.get();
    return result;
}
