#include "tools/publisher/tree_listing.h"

#include <windows.h>

#include "base/encoding.h"
#include "base/exception.h"

std::string NarrowEntryName(const std::filesystem::path& name, const std::string& folder) {
    const std::wstring& wide = name.native();
    if (wide.empty()) return std::string();
    BOOL usedDefault = FALSE;
    const int size = WideCharToMultiByte(CP_ACP, WC_NO_BEST_FIT_CHARS, wide.data(), static_cast<int>(wide.size()),
                                         nullptr, 0, nullptr, &usedDefault);
    std::string narrow(size > 0 ? size : 0, '\0');
    if (size > 0) {
        WideCharToMultiByte(CP_ACP, WC_NO_BEST_FIT_CHARS, wide.data(), static_cast<int>(wide.size()), &narrow[0], size,
                            nullptr, &usedDefault);
    }
    if (size <= 0 || usedDefault) {
        throw Exception("A patch cannot carry a name outside the system code page, in " + folder);
    }
    return narrow;
}

std::filesystem::path ToFileSystemPath(const std::string& path) {
    return std::filesystem::path(WidenFromCodePage(path));
}
