#include <windows.h>

#include "ui/message_box.h"

namespace {

UINT Style(const MessageBoxRequest& request) {
    UINT style = MB_SETFOREGROUND | MB_TOPMOST;
    switch (request.buttons) {
        case MessageButtons::Ok:
            style |= MB_OK;
            break;
        case MessageButtons::YesNo:
            style |= MB_YESNO;
            break;
        case MessageButtons::RetryCancel:
            style |= MB_RETRYCANCEL;
            break;
    }
    switch (request.icon) {
        case MessageIcon::Error:
            style |= MB_ICONERROR;
            break;
        case MessageIcon::Warning:
            style |= MB_ICONWARNING;
            break;
        case MessageIcon::Question:
            style |= MB_ICONQUESTION;
            break;
        case MessageIcon::Information:
            style |= MB_ICONINFORMATION;
            break;
    }
    if (request.systemModal) style |= MB_SYSTEMMODAL;
    return style;
}

}  // namespace

MessageAnswer ShowMessageBox(const MessageBoxRequest& request) {
    const int answer =
        MessageBoxW(static_cast<HWND>(request.owner), request.text.c_str(), request.caption.c_str(), Style(request));
    switch (answer) {
        case IDYES:
            return MessageAnswer::Yes;
        case IDNO:
            return MessageAnswer::No;
        case IDRETRY:
            return MessageAnswer::Retry;
        case IDOK:
            return MessageAnswer::Ok;
        default:
            return MessageAnswer::Cancel;
    }
}
