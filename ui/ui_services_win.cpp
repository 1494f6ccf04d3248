#include <windows.h>

// GDI+ needs the COM declarations that WIN32_LEAN_AND_MEAN leaves out.
#include <objidl.h>

#include <gdiplus.h>

#include "ui/fonts_win.h"
#include "ui/message_box_hook_win.h"
#include "ui/ui_services.h"

namespace {
bool hookInstalled = false;
ULONG_PTR graphicsToken = 0;  // 0 while GDI+ is not started
}  // namespace

void UiServices::InstallMessageBoxHook() { hookInstalled = ::InstallMessageBoxHook(); }

void UiServices::StartGraphics() {
    const Gdiplus::GdiplusStartupInput input;
    ULONG_PTR token = 0;
    if (Gdiplus::GdiplusStartup(&token, &input, nullptr) == Gdiplus::Ok) graphicsToken = token;
}

void UiServices::Shutdown() {
    DeleteFonts();
    if (hookInstalled) RemoveMessageBoxHook();
    hookInstalled = false;
    FreeMessageBoxHookSlot();
    if (graphicsToken != 0) Gdiplus::GdiplusShutdown(graphicsToken);
    graphicsToken = 0;
}
