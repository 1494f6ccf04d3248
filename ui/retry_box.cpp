#include "ui/retry_box.h"

#include "base/encoding.h"
#include "text/localization.h"
#include "ui/message_box.h"

bool RetryBox::AskRetryMove(const std::string& source, const std::string& destination) {
    return Ask(Localize("INSTALLER_FAILED_TO_MOVE_THE_FILE") + L"\n\n" + WidenFromCodePage(source) + L"\n\n" +
               Localize("INSTALLER_TO") + L"\n\n" + WidenFromCodePage(destination));
}

bool RetryBox::AskRetryDelete(const std::string& path) {
    return Ask(Localize("INSTALLER_FAILED_TO_DELETE_THE_FILE") + L"\n\n" + WidenFromCodePage(path));
}

bool RetryBox::Ask(const std::wstring& failure) {
    MessageBoxRequest question;
    question.text = failure + L"\n\n" + Localize("INSTALLER_CLOSE_FILES_AND_RETRY");
    question.caption = GetWindowTitle();
    question.buttons = MessageButtons::RetryCancel;
    question.icon = MessageIcon::Warning;
    return ShowMessageBox(question) == MessageAnswer::Retry;
}
