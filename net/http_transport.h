#pragma once

#include <chrono>
#include <cstdint>
#include <string>
#include <vector>

// The parts of an answer's head the program reads, each as the server sent
// it; empty when absent or unreadable.
struct HttpResponseHead {
    std::string status;  // the status code
    std::string contentLength;
    std::string contentRange;
    std::string etag;
    std::string lastModified;
};

// What an HTTP transfer does with the server's answer. The transport calls
// it on the thread that called HttpGet.
class HttpResponseSink {
public:
    // The head is in. Returns false to end the transfer here.
    virtual bool OnResponse(const HttpResponseHead& head) = 0;
    // Asked before each read (and while waiting for data); false stops.
    virtual bool KeepReading() = 0;
    // One piece of the body; false ends the transfer here.
    virtual bool OnData(const char* data, uint32_t size) = 0;

protected:
    HttpResponseSink() = default;
    HttpResponseSink(const HttpResponseSink&) = default;
    HttpResponseSink& operator=(const HttpResponseSink&) = default;
    ~HttpResponseSink() = default;
};

enum class HttpOutcome {
    NoSession,   // the HTTP library could not be set up
    NoResponse,  // the address could not be opened (name, connection, protocol, time-out)
    Abandoned,   // the sink turned down the response or a piece
    Stopped,     // KeepReading said no
    ReadFailed,  // the body broke off with an error, or stalled
    Complete,    // the body ended
};

// GET of address as the program's agent, fresh from the server (never from
// or into a cache), through the system's configured proxy, following
// redirects, with headers ("Name: value" each) added to the request. A
// connection that cannot be made, or a body from which no byte arrives,
// within stallTimeout fails.
HttpOutcome HttpGet(const std::string& address, const std::vector<std::string>& headers,
                    std::chrono::seconds stallTimeout, HttpResponseSink& sink);
