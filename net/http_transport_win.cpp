#include <windows.h>
#include <wininet.h>

#include <chrono>
#include <vector>

#include "base/unique_handle.h"
#include "net/http_transport.h"

namespace {

struct InternetHandleTraits {
    using Value = HINTERNET;
    static Value Invalid() { return nullptr; }
    static void Close(Value value) { InternetCloseHandle(value); }
};
using InternetHandle = UniqueHandle<InternetHandleTraits>;

const char kAgent[] = "IronvaleUpdater";
const char kHeaders[] = "Accept: */*\r\n\r\n";
const DWORD kHeadersLength = 15;
// A WinINet read returns once its whole piece has arrived, and each call is
// costly (under Wine far more so). The piece doubles while reads come back
// quickly and halves when one takes long: a fast line is read in large
// pieces, and a slow one still reports progress (after every read) and
// hears a stop within about a quarter of a second.
const DWORD kFirstRead = 64 * 1024;
const DWORD kSmallestRead = 16 * 1024;
const DWORD kLargestRead = 1024 * 1024;
const auto kQuickRead = std::chrono::milliseconds(50);
const auto kSlowRead = std::chrono::milliseconds(250);

}  // namespace

HttpOutcome HttpGet(const std::string& address, HttpResponseSink& sink) {
    const InternetHandle session(InternetOpenA(kAgent, INTERNET_OPEN_TYPE_PRECONFIG, nullptr, nullptr, 0));
    if (!session) return HttpOutcome::NoSession;
    const InternetHandle request(
        InternetOpenUrlA(session.Get(), address.c_str(), kHeaders, kHeadersLength, INTERNET_FLAG_RELOAD, 0));
    if (!request) return HttpOutcome::NoResponse;

    char status[32] = {};
    DWORD size = sizeof(status);
    std::string statusText;
    if (HttpQueryInfoA(request.Get(), HTTP_QUERY_STATUS_CODE, status, &size, nullptr)) statusText.assign(status, size);
    DWORD length = 0;
    size = sizeof(length);
    const bool lengthKnown =
        HttpQueryInfoA(request.Get(), HTTP_QUERY_CONTENT_LENGTH | HTTP_QUERY_FLAG_NUMBER, &length, &size, nullptr);
    if (!sink.OnResponse(statusText, lengthKnown != FALSE, length)) return HttpOutcome::Abandoned;

    std::vector<char> buffer(kLargestRead);
    DWORD piece = kFirstRead;
    while (sink.KeepReading()) {
        const auto began = std::chrono::steady_clock::now();
        DWORD read = 0;
        if (!InternetReadFile(request.Get(), buffer.data(), piece, &read)) return HttpOutcome::ReadFailed;
        if (read == 0) return HttpOutcome::Complete;
        const auto took = std::chrono::steady_clock::now() - began;
        if (took < kQuickRead && piece < kLargestRead) piece *= 2;
        if (took > kSlowRead && piece > kSmallestRead) piece /= 2;
        if (!sink.OnData(buffer.data(), read)) return HttpOutcome::Abandoned;
    }
    return HttpOutcome::Stopped;
}
