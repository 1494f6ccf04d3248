#include <curl/curl.h>
#include <unistd.h>

#include <memory>
#include <vector>

#include "net/location.h"

std::string GetUrlHostName(const std::string& url) {
    std::unique_ptr<CURLU, decltype(&curl_url_cleanup)> handle(curl_url(), &curl_url_cleanup);
    if (!handle) return std::string();
    // Any scheme, as the Windows URL cracker accepts any; no guessing of
    // a missing one, which that cracker refuses too.
    if (curl_url_set(handle.get(), CURLUPART_URL, url.c_str(), CURLU_NON_SUPPORT_SCHEME) != CURLUE_OK) {
        return std::string();
    }
    char* host = nullptr;
    if (curl_url_get(handle.get(), CURLUPART_HOST, &host, 0) != CURLUE_OK || host == nullptr) return std::string();
    std::string result(host);
    curl_free(host);
    // The Windows build cracks into a 256-byte buffer; keep the same limit.
    return result.size() < 256 ? result : std::string();
}

std::string GetProgramFolder() {
    std::vector<char> buffer(4096);
    const ssize_t length = readlink("/proc/self/exe", buffer.data(), buffer.size());
    if (length <= 0 || static_cast<size_t>(length) >= buffer.size()) return std::string();
    std::string path(buffer.data(), static_cast<size_t>(length));
    return path.substr(0, path.rfind('/') + 1);
}

bool IsUncLocation(const std::string& location) {
    return location.compare(0, 2, "\\\\") == 0 || location.compare(0, 2, "//") == 0;
}

bool IsRelativeLocation(const std::string& location) {
    return location.empty() || (location[0] != '/' && location[0] != '\\');
}
