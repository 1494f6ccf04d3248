#include <curl/curl.h>
#include <curl/header.h>

#include <chrono>
#include <cstdint>

#include "base/unique_handle.h"
#include "net/http_transport.h"

namespace {

// libcurl hands the body over in pieces of up to this size; progress is
// reported after every piece.
const long kPieceSize = 64 * 1024;

struct CurlTraits {
    using Value = CURL*;
    static Value Invalid() { return nullptr; }
    static void Close(Value value) { curl_easy_cleanup(value); }
};

struct CurlListTraits {
    using Value = curl_slist*;
    static Value Invalid() { return nullptr; }
    static void Close(Value value) { curl_slist_free_all(value); }
};

// curl hands back the grown list, the same one unless it was empty; a
// failed append leaves it as it was.
void Append(UniqueHandle<CurlListTraits>& list, const char* line) {
    if (curl_slist* grown = curl_slist_append(list.Get(), line)) {
        list.Release();  // part of grown
        list.Reset(grown);
    }
}

struct Transfer {
    CURL* curl;
    HttpResponseSink& sink;
    std::chrono::steady_clock::duration stallTimeout;
    std::chrono::steady_clock::time_point lastByte = std::chrono::steady_clock::now();
    curl_off_t received = 0;
    bool responded = false;
    bool abandoned = false;
    bool stopped = false;
    bool stalled = false;
};

// The value of the last answer's header name; empty when it has none.
std::string Header(CURL* curl, const char* name) {
    curl_header* header = nullptr;
    if (curl_easy_header(curl, name, 0, CURLH_HEADER, -1, &header) != CURLHE_OK) return "";
    return header->value;
}

// Hands the head to the sink once it is in.
bool Respond(Transfer& transfer) {
    transfer.responded = true;
    long code = 0;
    HttpResponseHead head;
    if (curl_easy_getinfo(transfer.curl, CURLINFO_RESPONSE_CODE, &code) == CURLE_OK && code != 0) {
        head.status = std::to_string(code);
    }
    head.contentLength = Header(transfer.curl, "Content-Length");
    head.contentRange = Header(transfer.curl, "Content-Range");
    head.etag = Header(transfer.curl, "ETag");
    head.lastModified = Header(transfer.curl, "Last-Modified");
    if (!transfer.sink.OnResponse(head)) {
        transfer.abandoned = true;
        return false;
    }
    return true;
}

size_t OnBody(char* data, size_t, size_t count, void* context) {
    Transfer& transfer = *static_cast<Transfer*>(context);
    if (!transfer.responded && !Respond(transfer)) return 0;
    if (count == 0) return 0;
    if (!transfer.sink.KeepReading()) {
        transfer.stopped = true;
        return 0;
    }
    if (!transfer.sink.OnData(data, static_cast<uint32_t>(count))) {
        transfer.abandoned = true;
        return 0;
    }
    return count;
}

// Also called while no data arrives, so a stop does not wait for the
// server, and a line that has gone quiet (from the connection on) ends the
// transfer instead of holding it for ever: the caller may try again.
int OnTick(void* context, curl_off_t, curl_off_t received, curl_off_t, curl_off_t) {
    Transfer& transfer = *static_cast<Transfer*>(context);
    const auto now = std::chrono::steady_clock::now();
    if (received != transfer.received) {
        transfer.received = received;
        transfer.lastByte = now;
    }
    transfer.stalled = now - transfer.lastByte > transfer.stallTimeout;
    transfer.stopped = !transfer.sink.KeepReading();
    return transfer.stalled || transfer.stopped ? 1 : 0;
}

void InitializeLibraryOnce() {
    static const CURLcode result = curl_global_init(CURL_GLOBAL_DEFAULT);
    static_cast<void>(result);
}

}  // namespace

HttpOutcome HttpGet(const std::string& address, const std::vector<std::string>& extraHeaders,
                    std::chrono::seconds stallTimeout, HttpResponseSink& sink) {
    InitializeLibraryOnce();
    const UniqueHandle<CurlTraits> curl(curl_easy_init());
    if (!curl) return HttpOutcome::NoSession;
    Transfer transfer{curl.Get(), sink, stallTimeout};
    UniqueHandle<CurlListTraits> headers;
    Append(headers, "Accept: */*");
    Append(headers, "Cache-Control: no-cache");
    Append(headers, "Pragma: no-cache");
    for (const std::string& line : extraHeaders) Append(headers, line.c_str());

    CURL* handle = curl.Get();
    curl_easy_setopt(handle, CURLOPT_URL, address.c_str());
    curl_easy_setopt(handle, CURLOPT_USERAGENT, "IronvaleUpdater");
    curl_easy_setopt(handle, CURLOPT_HTTPHEADER, headers.Get());
    curl_easy_setopt(handle, CURLOPT_PROTOCOLS_STR, "http");
    curl_easy_setopt(handle, CURLOPT_FOLLOWLOCATION, 1L);
    curl_easy_setopt(handle, CURLOPT_REDIR_PROTOCOLS_STR, "http,https");
    curl_easy_setopt(handle, CURLOPT_NOSIGNAL, 1L);
    curl_easy_setopt(handle, CURLOPT_BUFFERSIZE, kPieceSize);
    curl_easy_setopt(handle, CURLOPT_WRITEFUNCTION, &OnBody);
    curl_easy_setopt(handle, CURLOPT_WRITEDATA, &transfer);
    curl_easy_setopt(handle, CURLOPT_XFERINFOFUNCTION, &OnTick);
    curl_easy_setopt(handle, CURLOPT_XFERINFODATA, &transfer);
    curl_easy_setopt(handle, CURLOPT_NOPROGRESS, 0L);

    const CURLcode result = curl_easy_perform(handle);
    if (transfer.abandoned) return HttpOutcome::Abandoned;
    if (transfer.stopped) return HttpOutcome::Stopped;
    if (transfer.stalled) return transfer.responded ? HttpOutcome::ReadFailed : HttpOutcome::NoResponse;
    if (!transfer.responded) {
        // Headers without a body piece: an empty body, or one that broke
        // off before its first byte.
        long code = 0;
        curl_easy_getinfo(handle, CURLINFO_RESPONSE_CODE, &code);
        if (code == 0) return HttpOutcome::NoResponse;
        if (!Respond(transfer)) return HttpOutcome::Abandoned;
    }
    return result == CURLE_OK ? HttpOutcome::Complete : HttpOutcome::ReadFailed;
}
