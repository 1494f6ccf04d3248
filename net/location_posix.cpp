#include <curl/curl.h>
#include <unistd.h>

#include <vector>

#include "base/unique_handle.h"
#include "net/location.h"

namespace {

struct CurlUrlTraits {
    using Value = CURLU*;
    static Value Invalid() { return nullptr; }
    static void Close(Value value) { curl_url_cleanup(value); }
};

struct CurlTextTraits {
    using Value = char*;
    static Value Invalid() { return nullptr; }
    static void Close(Value value) { curl_free(value); }
};

}  // namespace

std::string GetUrlHostName(const std::string& url) {
    const UniqueHandle<CurlUrlTraits> handle(curl_url());
    if (!handle) return std::string();
    // Any scheme, as the Windows URL cracker accepts any; no guessing of
    // a missing one, which that cracker refuses too.
    if (curl_url_set(handle.Get(), CURLUPART_URL, url.c_str(), CURLU_NON_SUPPORT_SCHEME) != CURLUE_OK) {
        return std::string();
    }
    UniqueHandle<CurlTextTraits> host;
    if (curl_url_get(handle.Get(), CURLUPART_HOST, host.Receive(), 0) != CURLUE_OK || !host) return std::string();
    std::string result(host.Get());
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
