#include <cstdio>
#include <iostream>
#include <string>

#include "base/encoding.h"
#include "base/string_helpers.h"
#include "ui/message_box.h"

namespace {

// The answer line without its line end and trailing blanks, in lower case.
std::string Normalise(std::string text) {
    while (!text.empty() && (text.back() == '\r' || text.back() == ' ')) text.pop_back();
    return ToLowerAscii(text);
}

const char* IconName(MessageIcon icon) {
    switch (icon) {
        case MessageIcon::Error:
            return "Error";
        case MessageIcon::Warning:
            return "Warning";
        case MessageIcon::Question:
            return "Question";
        case MessageIcon::Information:
            return "Information";
    }
    return "";
}

}  // namespace

MessageAnswer ShowMessageBox(const MessageBoxRequest& request) {
    std::cerr << "[" << IconName(request.icon) << "] " << NarrowToUtf8(request.caption) << "\n"
              << NarrowToUtf8(request.text) << "\n";
    if (request.buttons == MessageButtons::Ok) {
        std::cerr.flush();
        return MessageAnswer::Ok;
    }
    const bool retry = request.buttons == MessageButtons::RetryCancel;
    std::cerr << (retry ? "[R]etry / [c]ancel? " : "[Y]es / [n]o? ");
    std::cerr.flush();
    // An empty line takes the default (first) button. End of input takes
    // the negative one: with nobody to answer, a Retry box must not loop.
    const MessageAnswer negative = retry ? MessageAnswer::Cancel : MessageAnswer::No;
    std::string answer;
    if (!std::getline(std::cin, answer)) return negative;
    answer = Normalise(answer);
    for (;;) {
        if (answer.empty() || answer == "y" || answer == "yes" || answer == "r" || answer == "retry") {
            return retry ? MessageAnswer::Retry : MessageAnswer::Yes;
        }
        if (answer == "n" || answer == "no" || answer == "c" || answer == "cancel") {
            return retry ? MessageAnswer::Cancel : MessageAnswer::No;
        }
        std::cerr << (retry ? "Please answer r or c: " : "Please answer y or n: ");
        std::cerr.flush();
        if (!std::getline(std::cin, answer)) return negative;
        answer = Normalise(answer);
    }
}
