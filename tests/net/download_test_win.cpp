#include <windows.h>

// Wine's CopyFileEx copies without ever calling the progress routine (and so cannot be stopped part-way); Windows calls
// it after every piece.
bool PlatformCopyReportsProgress() {
    return GetProcAddress(GetModuleHandleA("ntdll.dll"), "wine_get_version") == nullptr;
}
