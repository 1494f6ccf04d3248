#include "ui/gui_manager.h"

#include <chrono>
#include <thread>

#include "base/encoding.h"
#include "text/localization.h"

void GuiManager::WaitWhileConfirming() {
    while (confirming) {
        std::this_thread::sleep_for(std::chrono::milliseconds(1000));
        InvalidateProgress();
    }
}

void GuiManager::ShowError(const std::string& text) { ShowError(WidenFromCodePage(text)); }

void GuiManager::ShowError(const std::wstring& text) { ShowBox(text, MessageButtons::Ok, MessageIcon::Error); }

bool GuiManager::AskYesNo(const std::wstring& text) {
    return ShowBox(text, MessageButtons::YesNo, MessageIcon::Question) == MessageAnswer::Yes;
}

bool GuiManager::ShowInfo(const std::wstring& text) {
    return ShowBox(text, MessageButtons::Ok, MessageIcon::Information) == MessageAnswer::Ok;
}

MessageAnswer GuiManager::ShowBox(const std::wstring& text, MessageButtons buttons, MessageIcon icon) {
    MessageBoxRequest request;
    request.text = text;
    request.caption = GetWindowTitle();
    request.buttons = buttons;
    request.icon = icon;
    return ShowOwnedBox(request);
}

bool GuiManager::ConfirmCancel(HitArea area) {
    confirming = true;
    const bool confirmed = ShowBox(Localize(ConfirmationTextKey(area)), MessageButtons::YesNo, MessageIcon::Question) ==
                           MessageAnswer::Yes;
    if (confirmed && cancelable != nullptr) cancelable->Cancel();
    confirming = false;
    return confirmed;
}

std::wstring GuiManager::GetStatusText() const {
    std::lock_guard<std::mutex> lock(statusMutex);
    return statusText;
}
