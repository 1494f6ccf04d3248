#include <curl/curl.h>

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
    bool responded = false;
    bool abandoned = false;
    bool stopped = false;
};

// Hands the status and length to the sink once the headers are in.
bool Respond(Transfer& transfer) {
    transfer.responded = true;
    long code = 0;
    std::string statusText;
    if (curl_easy_getinfo(transfer.curl, CURLINFO_RESPONSE_CODE, &code) == CURLE_OK && code != 0) {
        statusText = std::to_string(code);
    }
    curl_off_t length = -1;
    if (curl_easy_getinfo(transfer.curl, CURLINFO_CONTENT_LENGTH_DOWNLOAD_T, &length) != CURLE_OK) length = -1;
    const bool lengthKnown = length >= 0 && length <= static_cast<curl_off_t>(UINT32_MAX);
    if (!transfer.sink.OnResponse(statusText, lengthKnown, lengthKnown ? static_cast<uint32_t>(length) : 0)) {
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

// Also called while no data arrives, so a stop does not wait for the server.
int OnTick(void* context, curl_off_t, curl_off_t, curl_off_t, curl_off_t) {
    Transfer& transfer = *static_cast<Transfer*>(context);
    if (transfer.sink.KeepReading()) return 0;
    transfer.stopped = true;
    return 1;
}

void InitializeLibraryOnce() {
    static const CURLcode result = curl_global_init(CURL_GLOBAL_DEFAULT);
    static_cast<void>(result);
}

}  // namespace

HttpOutcome HttpGet(const std::string& address, HttpResponseSink& sink) {
    InitializeLibraryOnce();
    const UniqueHandle<CurlTraits> curl(curl_easy_init());
    if (!curl) return HttpOutcome::NoSession;
    Transfer transfer{curl.Get(), sink};
    UniqueHandle<CurlListTraits> headers;
    Append(headers, "Accept: */*");
    Append(headers, "Cache-Control: no-cache");
    Append(headers, "Pragma: no-cache");

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
