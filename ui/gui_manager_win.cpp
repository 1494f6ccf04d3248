#include <windows.h>

#include <objidl.h>
#include <ole2.h>
#include <windowsx.h>

#include <gdiplus.h>

#include "ui/gui_manager.h"

#include "base/exception.h"
#include "base/log.h"
#include "base/unique_handle_win.h"
#include "resources/resource_ids.h"
#include "text/localization.h"
#include "ui/fonts_win.h"
#include "ui/gdi_handles_win.h"
#include "ui/gdiplus_bitmap_win.h"
#include "ui/message_box_hook_win.h"

namespace {

const wchar_t* const kWindowClassName = L"IRONVALE.MAIN";

}  // namespace

// The UI thread with its window. Everything but the thread identity and
// the window handle is touched by the UI thread alone.
class GuiManager::UiThread {
public:
    explicit UiThread(GuiManager& manager);

    bool IsUiThread() const { return threadId != 0 && GetCurrentThreadId() == threadId; }
    // Marks area for repainting, without erasing; nothing without a window.
    void Invalidate(const PixelRect& area) const;

    static DWORD WINAPI ThreadMain(void* parameter);

    UniqueKernelHandle thread;
    std::atomic<DWORD> threadId{0};
    std::atomic<HWND> window{nullptr};
    UniqueKernelHandle readyEvent;

private:
    static LRESULT CALLBACK WindowProcedure(HWND window, UINT message, WPARAM wParam, LPARAM lParam);

    void Run();
    void CreateMainWindow();
    void DestroyMainWindow();
    LRESULT Handle(UINT message, WPARAM wParam, LPARAM lParam);
    void CentreAndShow();
    void Paint();
    void RenderFrame(Gdiplus::Graphics& graphics) const;
    void DrawLabel(Gdiplus::Graphics& graphics, const std::wstring& text, PixelPoint origin,
                   Gdiplus::StringAlignment alignment, const Gdiplus::Color& colour) const;
    void OnButtonUp(int x, int y);

    GuiManager& owner;
    ATOM windowClass = 0;
    HDC windowDc = nullptr;  // released with its window, which it needs
    UniqueMemoryDc memoryDc;
    UniqueBitmap backBuffer;
    HGDIOBJ previousBitmap = nullptr;
    HINSTANCE instance = nullptr;
    bool dragging = false;
    POINT dragStart = {};
    HCURSOR handCursor = nullptr;
    HCURSOR waitCursor = nullptr;
    GdiPlusBitmapResource background;
    GdiPlusBitmapResource defaultPicture;
    GdiPlusBitmapResource progressUnit;
    GdiPlusBitmapResource beginProgressUnit;
    GdiPlusBitmapResource endProgressUnit;
    MainWindowFont font;
};

GuiManager::UiThread::UiThread(GuiManager& manager)
    : readyEvent(CreateEventW(nullptr, FALSE, FALSE, nullptr)),
      owner(manager),
      instance(GetModuleHandleW(nullptr)),
      handCursor(LoadCursor(nullptr, IDC_HAND)) {}

void GuiManager::UiThread::Invalidate(const PixelRect& area) const {
    HWND target = window;
    if (target == nullptr) return;
    const RECT rect = {area.left, area.top, area.right, area.bottom};
    InvalidateRect(target, &rect, FALSE);
}

DWORD WINAPI GuiManager::UiThread::ThreadMain(void* parameter) {
    static_cast<UiThread*>(parameter)->Run();
    return 0;
}

void GuiManager::UiThread::Run() {
    OleInitialize(nullptr);
    // The confirmations shown on this thread get their buttons relabelled
    // by a hook of this thread.
    const bool hooked = InstallMessageBoxHook();
    CreateMainWindow();
    SetEvent(readyEvent.Get());
    MSG message;
    bool running = true;
    while (running && GetMessageW(&message, nullptr, 0, 0) > 0) {
        if (message.hwnd == nullptr) {
            const auto permille = static_cast<int32_t>(message.lParam);
            switch (message.message) {
                case kShowWindowMessage:
                    CentreAndShow();
                    continue;
                case kQuitUiThreadMessage:
                    running = false;
                    continue;
                case kOverallProgressMessage:
                    if (owner.progress.SetOverall(permille)) Invalidate(MainWindowLayout::kProgressRect);
                    continue;
                case kFileProgressMessage:
                    if (owner.progress.SetFile(permille)) Invalidate(MainWindowLayout::kProgressRect);
                    continue;
                default:
                    break;
            }
        }
        TranslateMessage(&message);
        DispatchMessageW(&message);
    }
    DestroyMainWindow();
    if (hooked) RemoveMessageBoxHook();
    OleUninitialize();
}

void GuiManager::UiThread::CreateMainWindow() {
    if (windowClass == 0) {
        WNDCLASSEXW windowClassInfo = {};
        windowClassInfo.cbSize = sizeof(windowClassInfo);
        windowClassInfo.style = CS_HREDRAW | CS_VREDRAW;
        windowClassInfo.lpfnWndProc = WindowProcedure;
        windowClassInfo.hInstance = instance;
        windowClassInfo.hIcon = LoadIconW(instance, MAKEINTRESOURCEW(IDI_IRONVALE));
        windowClassInfo.hIconSm = windowClassInfo.hIcon;
        windowClassInfo.lpszClassName = kWindowClassName;
        windowClass = RegisterClassExW(&windowClassInfo);
    }
    waitCursor = LoadCursor(nullptr, IDC_WAIT);
    font = CreateMainWindowFont();
    progressUnit.Load("IDR_PROGRESSUNIT");
    beginProgressUnit.Load("IDR_BEGINPROGRESSUNIT");
    endProgressUnit.Load("IDR_ENDPROGRESSUNIT");
    background.Load("IDR_BACKGROUND");
    defaultPicture.Load("IDR_DEFAULTIMG");
    const int width = background.Get() != nullptr ? background.Width() : MainWindowLayout::kFallbackWidth;
    const int height = background.Get() != nullptr ? background.Height() : MainWindowLayout::kFallbackHeight;

    HWND created = CreateWindowExW(WS_EX_LAYERED, kWindowClassName, GetWindowTitle().c_str(), WS_POPUP, 0, 0, width,
                                   height, nullptr, nullptr, instance, this);
    if (created == nullptr) {
        LOG(Error) << "Could not create the main window, error " << GetLastError();
        return;
    }
    SetLayeredWindowAttributes(
        created,
        RGB(MainWindowLayout::kColourKeyRed, MainWindowLayout::kColourKeyGreen, MainWindowLayout::kColourKeyBlue), 255,
        LWA_COLORKEY);
    // The system owns the region once it is set.
    SetWindowRgn(created, CreateRectRgn(1, 1, width - 1, height - 1), TRUE);
    windowDc = GetDC(created);
    memoryDc.Reset(CreateCompatibleDC(windowDc));
    backBuffer.Reset(CreateCompatibleBitmap(windowDc, width, height));
    previousBitmap = SelectObject(memoryDc.Get(), backBuffer.Get());
    window = created;
}

void GuiManager::UiThread::DestroyMainWindow() {
    HWND destroyed = window.exchange(nullptr);
    // The bitmap goes back out of the memory context before either is deleted.
    if (memoryDc) SelectObject(memoryDc.Get(), previousBitmap);
    memoryDc.Reset();
    backBuffer.Reset();
    if (windowDc != nullptr) ReleaseDC(destroyed, windowDc);
    if (destroyed != nullptr) DestroyWindow(destroyed);
    windowDc = nullptr;
    font = MainWindowFont();
    progressUnit.Release();
    beginProgressUnit.Release();
    endProgressUnit.Release();
    background.Release();
    defaultPicture.Release();
}

LRESULT CALLBACK GuiManager::UiThread::WindowProcedure(HWND window, UINT message, WPARAM wParam, LPARAM lParam) {
    if (message == WM_NCCREATE) {
        const auto* creation = reinterpret_cast<const CREATESTRUCTW*>(lParam);
        SetWindowLongPtrW(window, GWLP_USERDATA, reinterpret_cast<LONG_PTR>(creation->lpCreateParams));
    }
    auto* self = reinterpret_cast<UiThread*>(GetWindowLongPtrW(window, GWLP_USERDATA));
    if (self == nullptr || self->window != window) return DefWindowProcW(window, message, wParam, lParam);
    return self->Handle(message, wParam, lParam);
}

LRESULT GuiManager::UiThread::Handle(UINT message, WPARAM wParam, LPARAM lParam) {
    const int x = GET_X_LPARAM(lParam);
    const int y = GET_Y_LPARAM(lParam);
    switch (message) {
        case WM_PAINT:
            Paint();
            return 0;
        case WM_ERASEBKGND:
            return 1;
        case WM_LBUTTONDOWN:
            dragStart = {x, y};
            dragging = true;
            SetCapture(window);
            return 0;
        case WM_MOUSEMOVE:
            SetCursor(HitTest(x, y) != HitArea::None ? handCursor : waitCursor);
            if (dragging) {
                RECT rect;
                GetWindowRect(window, &rect);
                SetWindowPos(window, nullptr, rect.left + x - dragStart.x, rect.top + y - dragStart.y, 0, 0,
                             SWP_NOSIZE | SWP_NOZORDER | SWP_NOREDRAW);
            }
            return 0;
        case WM_LBUTTONUP:
            dragging = false;
            ReleaseCapture();
            OnButtonUp(x, y);
            return 0;
        default:
            return DefWindowProcW(window, message, wParam, lParam);
    }
}

void GuiManager::UiThread::OnButtonUp(int x, int y) {
    const HitArea area = HitTest(x, y);
    // While a confirmation is open the window is disabled; the check keeps
    // a second box from stacking on the first all the same.
    if (area == HitArea::None || owner.confirming) return;
    if (owner.ConfirmCancel(area)) PostQuitMessage(0);
}

void GuiManager::UiThread::CentreAndShow() {
    HWND shown = window;
    if (shown == nullptr) return;
    RECT rect;
    GetWindowRect(shown, &rect);
    const int x = (GetSystemMetrics(SM_CXSCREEN) - (rect.right - rect.left)) / 2;
    const int y = (GetSystemMetrics(SM_CYSCREEN) - (rect.bottom - rect.top)) / 2;
    SetWindowPos(shown, nullptr, x, y, 0, 0, SWP_NOSIZE | SWP_NOZORDER);
    ShowWindow(shown, SW_SHOW);
}

void GuiManager::UiThread::Paint() {
    RECT rect;
    GetWindowRect(window, &rect);
    {
        Gdiplus::Graphics graphics(memoryDc.Get());
        RenderFrame(graphics);
    }
    BitBlt(windowDc, 0, 0, rect.right - rect.left, rect.bottom - rect.top, memoryDc.Get(), 0, 0, SRCCOPY);
    // Without this the system would ask for the same paint again at once.
    ValidateRect(window, nullptr);
}

void GuiManager::UiThread::RenderFrame(Gdiplus::Graphics& graphics) const {
    using namespace MainWindowLayout;
    if (background.Get() != nullptr) {
        graphics.DrawImage(background.Get(), 0, 0, background.Width(), background.Height());
    }
    if (defaultPicture.Get() != nullptr) {
        graphics.DrawImage(defaultPicture.Get(), kDefaultPictureOrigin.x, kDefaultPictureOrigin.y,
                           defaultPicture.Width(), defaultPicture.Height());
    }
    const ProgressBarPieces bar = LayOutProgressBar(
        owner.progress.Total(), {progressUnit.Width(), beginProgressUnit.Width(), endProgressUnit.Width()});
    // Nearest neighbour keeps the stretched piece's columns crisp; the
    // half-pixel offset keeps its first and last column from fading.
    if (bar.middle) {
        graphics.SetInterpolationMode(Gdiplus::InterpolationModeNearestNeighbor);
        graphics.SetPixelOffsetMode(Gdiplus::PixelOffsetModeHalf);
        graphics.DrawImage(progressUnit.Get(), kProgressOrigin.x, kProgressOrigin.y, bar.length, progressUnit.Height());
    }
    if (bar.begin) {
        graphics.SetInterpolationMode(Gdiplus::InterpolationModeNearestNeighbor);
        graphics.DrawImage(beginProgressUnit.Get(), kProgressOrigin.x, kProgressOrigin.y, beginProgressUnit.Width(),
                           beginProgressUnit.Height());
    }
    if (bar.end) {
        graphics.SetInterpolationMode(Gdiplus::InterpolationModeNearestNeighbor);
        graphics.DrawImage(endProgressUnit.Get(), bar.endLeft, kProgressOrigin.y, endProgressUnit.Width(),
                           endProgressUnit.Height());
    }
    if (font.font == nullptr) return;
    const Gdiplus::Color black(255, 0, 0, 0);
    const Gdiplus::Color white(255, 255, 255, 255);
    DrawLabel(graphics, Localize("INSTALLER_DIALOG_CANCEL"), kCancelLabelOrigin, Gdiplus::StringAlignmentCenter, black);
    DrawLabel(graphics, Localize("INSTALLER_GAME_NAME") + L" - " + Localize("INSTALLER_UPDATER_HEADER"), kTitleOrigin,
              Gdiplus::StringAlignmentNear, white);
    DrawLabel(graphics, owner.GetStatusText(), kStatusTextOrigin, Gdiplus::StringAlignmentNear, black);
}

void GuiManager::UiThread::DrawLabel(Gdiplus::Graphics& graphics, const std::wstring& text, PixelPoint origin,
                                     Gdiplus::StringAlignment alignment, const Gdiplus::Color& colour) const {
    graphics.SetInterpolationMode(Gdiplus::InterpolationModeHighQualityBilinear);
    graphics.SetTextRenderingHint(Gdiplus::TextRenderingHintAntiAliasGridFit);
    Gdiplus::SolidBrush brush(colour);
    Gdiplus::StringFormat format;
    format.SetAlignment(alignment);
    // A layout rectangle of no size: no wrapping and no clipping.
    const Gdiplus::RectF layout(static_cast<Gdiplus::REAL>(origin.x), static_cast<Gdiplus::REAL>(origin.y), 0, 0);
    graphics.DrawString(text.c_str(), static_cast<INT>(text.size()), font.font, layout, &format, &brush);
}

GuiManager::GuiManager() : ui(std::make_unique<UiThread>(*this)) {}

GuiManager::~GuiManager() { Stop(); }

void GuiManager::Start(ICancelable* cancelableToTell) {
    if (ui->thread) {
        if (WaitForSingleObject(ui->thread.Get(), 100) != WAIT_OBJECT_0) {
            throw Exception("GuiManager is already running.");
        }
        ui->thread.Reset();
        ui->threadId = 0;
    }
    cancelable = cancelableToTell;
    ResetEvent(ui->readyEvent.Get());
    DWORD id = 0;
    ui->thread.Reset(CreateThread(nullptr, 0, UiThread::ThreadMain, ui.get(), 0, &id));
    if (!ui->thread) throw Exception("Could not start the window's thread.");
    ui->threadId = id;
    HANDLE handles[2] = {ui->thread.Get(), ui->readyEvent.Get()};
    WaitForMultipleObjects(2, handles, FALSE, INFINITE);
}

void GuiManager::Stop() {
    if (!ui->thread) return;
    // A thread message that arrives while a box of the UI thread is open is
    // lost in the box's own message loop: post again until the thread ends.
    do {
        PostThreadMessageW(ui->threadId, kQuitUiThreadMessage, 0, 0);
    } while (WaitForSingleObject(ui->thread.Get(), 100) == WAIT_TIMEOUT);
    ui->thread.Reset();
    ui->threadId = 0;
}

void GuiManager::Show() {
    if (ui->threadId != 0) PostThreadMessageW(ui->threadId, kShowWindowMessage, 0, 0);
}

void GuiManager::SetOverallProgress(int32_t permille) {
    if (ui->IsUiThread()) {
        if (progress.SetOverall(permille)) ui->Invalidate(MainWindowLayout::kProgressRect);
    } else if (ui->threadId != 0) {
        PostThreadMessageW(ui->threadId, kOverallProgressMessage, 0, permille);
    }
}

void GuiManager::SetFileProgress(int32_t permille) {
    if (ui->IsUiThread()) {
        if (progress.SetFile(permille)) ui->Invalidate(MainWindowLayout::kProgressRect);
    } else if (ui->threadId != 0) {
        PostThreadMessageW(ui->threadId, kFileProgressMessage, 0, permille);
    }
}

void GuiManager::SetProgressTotal(int32_t permille) {
    if (progress.SetTotal(permille)) ui->Invalidate(MainWindowLayout::kProgressRect);
}

void GuiManager::SetStatusText(const std::wstring& text) {
    {
        std::lock_guard<std::mutex> lock(statusMutex);
        statusText = text;
    }
    ui->Invalidate(MainWindowLayout::kStatusTextRect);
}

WindowHandle GuiManager::GetWindowHandle() const { return ui->window; }

void GuiManager::InvalidateProgress() { ui->Invalidate(MainWindowLayout::kProgressRect); }

MessageAnswer GuiManager::ShowOwnedBox(MessageBoxRequest& request) {
    request.owner = ui->window;
    return ShowMessageBox(request);
}
