#include "ui/move_retry_box.h"

#include "base/encoding.h"
#include "text/localization.h"
#include "ui/message_box.h"

bool MoveRetryBox::AskRetryMove(const std::string& source, const std::string& destination) {
    MessageBoxRequest question;
    question.text = Localize("INSTALLER_FAILED_TO_MOVE_THE_FILE") + L"\n\n" + WidenFromCodePage(source) + L"\n\n" +
                    Localize("INSTALLER_TO") + L"\n\n" + WidenFromCodePage(destination) + L"\n\n" +
                    Localize("INSTALLER_CLOSE_FILES_AND_RETRY");
    question.caption = GetWindowTitle();
    question.buttons = MessageButtons::RetryCancel;
    question.icon = MessageIcon::Warning;
    return ShowMessageBox(question) == MessageAnswer::Retry;
}
