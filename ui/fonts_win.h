#pragma once

// The font objects of the Windows program and the helpers that put them on
// windows. Only Windows code includes this header.

#include <windows.h>

// GDI+ needs the COM declarations that WIN32_LEAN_AND_MEAN leaves out.
#include <objidl.h>

#include <gdiplus.h>

#include <memory>
#include <vector>

#include "ui/fonts.h"
#include "ui/gdi_handles_win.h"

// Enumerates the installed fonts with Japanese characters and creates the
// first available candidate; with none of them installed, the system's
// choice for an empty face name at the default size. Null when no
// Japanese font is installed at all.
UniqueFont CreateBestFont(const std::vector<FontCandidate>& candidates, int32_t defaultHeight, int32_t defaultWeight);

// Null unless the language is Japanese. Made on first use and kept; while
// no Japanese font is installed, each call searches again.
HFONT GetDialogFont();
Gdiplus::Font* GetMainWindowFont();

// At process end, before GDI+ shuts down.
void DeleteFonts();

// Sets the dialog font, if there is one, on window and all its descendants.
void ApplyDialogFont(HWND window);
// Sends the message to each child of window in z-order; with recursive,
// to each child's children too, depth first.
void SendToDescendants(HWND window, UINT message, WPARAM wParam, LPARAM lParam, bool recursive);

// The main window's drawing font. For the embedded font the window also
// owns the collection the font comes from; members go in reverse order,
// the font before its collection.
struct MainWindowFont {
    std::unique_ptr<Gdiplus::PrivateFontCollection> collection;
    std::unique_ptr<Gdiplus::Font> ownFont;
    Gdiplus::Font* font = nullptr;  // ownFont, or the shared Japanese font
};

// GetMainWindowFont() if that gives a font, else the embedded font at 11
// points, bold; no font when the resource is missing or holds no family.
MainWindowFont CreateMainWindowFont();
