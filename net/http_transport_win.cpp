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

// The header as text (the status code, a length, a date); empty when the
// answer has none.
std::string Query(HINTERNET request, DWORD header) {
    char text[256] = {};
    DWORD size = sizeof(text);
    if (!HttpQueryInfoA(request, header, text, &size, nullptr) || size >= sizeof(text)) return "";
    return std::string(text, size);
}

// The handle's time-outs: a connection that takes this long, or a read
// that waits this long for a byte, fails, and the caller may try again.
void SetStallTimeout(HINTERNET handle, std::chrono::seconds stallTimeout) {
    DWORD stall = static_cast<DWORD>(std::chrono::milliseconds(stallTimeout).count());
    for (const DWORD option : {INTERNET_OPTION_CONNECT_TIMEOUT, INTERNET_OPTION_RECEIVE_TIMEOUT}) {
        InternetSetOptionA(handle, option, &stall, sizeof(stall));
    }
}

}  // namespace

HttpOutcome HttpGet(const std::string& address, const std::vector<std::string>& headers,
                    std::chrono::seconds stallTimeout, HttpResponseSink& sink) {
    const InternetHandle session(InternetOpenA(kAgent, INTERNET_OPEN_TYPE_PRECONFIG, nullptr, nullptr, 0));
    if (!session) return HttpOutcome::NoSession;
    // No part of an address is longer than the address.
    std::vector<char> host(address.size() + 1), path(address.size() + 1), query(address.size() + 1);
    URL_COMPONENTSA parts = {};
    parts.dwStructSize = sizeof(parts);
    parts.lpszHostName = host.data();
    parts.dwHostNameLength = static_cast<DWORD>(host.size());
    parts.lpszUrlPath = path.data();
    parts.dwUrlPathLength = static_cast<DWORD>(path.size());
    parts.lpszExtraInfo = query.data();
    parts.dwExtraInfoLength = static_cast<DWORD>(query.size());
    if (!InternetCrackUrlA(address.c_str(), 0, 0, &parts)) return HttpOutcome::NoResponse;
    // A request of its own, not InternetOpenUrl's: its time-outs are set
    // before it is sent (Wine reads them only then), and the lines that ask
    // for a range go in through HttpAddRequestHeaders. Nothing comes from
    // or goes into WinINet's cache.
    const InternetHandle connection(
        InternetConnectA(session.Get(), host.data(), parts.nPort, nullptr, nullptr, INTERNET_SERVICE_HTTP, 0, 0));
    if (!connection) return HttpOutcome::NoResponse;
    SetStallTimeout(connection.Get(), stallTimeout);
    const std::string target = std::string(path.data()) + query.data();
    const InternetHandle request(HttpOpenRequestA(connection.Get(), "GET", target.c_str(), nullptr, nullptr, nullptr,
                                                  INTERNET_FLAG_RELOAD | INTERNET_FLAG_NO_CACHE_WRITE, 0));
    if (!request) return HttpOutcome::NoResponse;
    SetStallTimeout(request.Get(), stallTimeout);
    std::string lines = "Accept: */*\r\n";
    for (const std::string& line : headers) lines += line + "\r\n";
    if (!HttpAddRequestHeadersA(request.Get(), lines.c_str(), static_cast<DWORD>(lines.size()),
                                HTTP_ADDREQ_FLAG_ADD | HTTP_ADDREQ_FLAG_REPLACE) ||
        !HttpSendRequestA(request.Get(), nullptr, 0, nullptr, 0)) {
        return HttpOutcome::NoResponse;
    }

    HttpResponseHead head;
    head.status = Query(request.Get(), HTTP_QUERY_STATUS_CODE);
    head.contentLength = Query(request.Get(), HTTP_QUERY_CONTENT_LENGTH);
    head.contentRange = Query(request.Get(), HTTP_QUERY_CONTENT_RANGE);
    head.etag = Query(request.Get(), HTTP_QUERY_ETAG);
    head.lastModified = Query(request.Get(), HTTP_QUERY_LAST_MODIFIED);
    if (!sink.OnResponse(head)) return HttpOutcome::Abandoned;

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
