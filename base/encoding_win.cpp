#include "base/encoding.h"

#include <windows.h>

std::wstring WidenFromCodePage(const std::string& text) {
    if (text.empty()) return std::wstring();
    // Converting with the terminator mirrors how the text is shown: a
    // failure anywhere yields no text at all rather than a fragment.
    const int length = static_cast<int>(text.size()) + 1;
    int needed = MultiByteToWideChar(CP_THREAD_ACP, 0, text.c_str(), length, nullptr, 0);
    if (needed <= 0) return std::wstring();
    std::wstring wide(static_cast<size_t>(needed), L'\0');
    if (MultiByteToWideChar(CP_THREAD_ACP, 0, text.c_str(), length, &wide[0], needed) != needed) {
        return std::wstring();
    }
    wide.resize(static_cast<size_t>(needed) - 1);
    return wide;
}
