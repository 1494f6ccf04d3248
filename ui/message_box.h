#pragma once

#include <string>

// The program's one way of asking or telling the user something in a box.
// Windows: MessageBoxW, always foreground and topmost. POSIX: the question
// goes to the terminal (stderr) and one answer line is read from stdin;
// an empty line takes the default (first) button, end of input the other.
enum class MessageButtons { Ok, YesNo, RetryCancel };
enum class MessageIcon { Error, Warning, Question, Information };
enum class MessageAnswer { Ok, Cancel, Yes, No, Retry };

struct MessageBoxRequest {
    std::wstring text;
    std::wstring caption;
    MessageButtons buttons = MessageButtons::Ok;
    MessageIcon icon = MessageIcon::Information;
    bool systemModal = false;
    void* owner = nullptr;  // owning window (HWND), none when null
};

MessageAnswer ShowMessageBox(const MessageBoxRequest& request);

// A box with OK under the program's title, for what must be said while no
// window exists (before it is made, or after it is gone).
void ShowTitledMessage(const std::wstring& text, MessageIcon icon);
