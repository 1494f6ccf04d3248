#include <windows.h>

#include "net/file_copy.h"

namespace {

DWORD CALLBACK OnCopyProgress(LARGE_INTEGER total, LARGE_INTEGER done, LARGE_INTEGER, LARGE_INTEGER, DWORD, DWORD,
                              HANDLE, HANDLE, LPVOID context) {
    const CopyProgress& progress = *static_cast<const CopyProgress*>(context);
    const bool going = progress(static_cast<uint64_t>(done.QuadPart), static_cast<uint64_t>(total.QuadPart));
    return going ? PROGRESS_CONTINUE : PROGRESS_CANCEL;
}

}  // namespace

bool CopyFileWithProgress(const std::string& source, const std::string& destination, const CopyProgress& progress) {
    // PROGRESS_CANCEL makes CopyFileEx delete the partial destination.
    return CopyFileExA(source.c_str(), destination.c_str(), &OnCopyProgress, const_cast<CopyProgress*>(&progress),
                       nullptr, 0) != FALSE;
}
