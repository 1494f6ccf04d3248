#include "ui/message_box.h"

#include "text/localization.h"

void ShowTitledMessage(const std::wstring& text, MessageIcon icon) {
    MessageBoxRequest request;
    request.text = text;
    request.caption = GetWindowTitle();
    request.icon = icon;
    ShowMessageBox(request);
}
