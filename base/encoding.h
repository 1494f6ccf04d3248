#pragma once

#include <string>

// Narrow text (paths, log, XML) is in the system code page on Windows and
// UTF-8 elsewhere; everything shown to the user is wide.

// Converts narrow text from the thread's ANSI code page (POSIX: UTF-8).
// Returns an empty string when the text cannot be converted.
std::wstring WidenFromCodePage(const std::string& text);

// Converts wide text to UTF-8, for consoles and test output.
std::string NarrowToUtf8(const std::wstring& text);

// Converts UTF-16 code units to the platform's wide string.
std::wstring WidenFromUtf16(const char16_t* units, size_t count);
