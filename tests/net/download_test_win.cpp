#include <windows.h>

#include <string>

// The extended-length form is a UNC path that reaches local drives too.
std::string UncFormOf(const std::string& absolutePath) { return "\\\\?\\" + absolutePath; }

// Wine's CopyFileEx copies without ever calling the progress routine (and so cannot be stopped part-way); Windows calls
// it after every piece.
bool PlatformCopyReportsProgress() {
    return GetProcAddress(GetModuleHandleA("ntdll.dll"), "wine_get_version") == nullptr;
}
