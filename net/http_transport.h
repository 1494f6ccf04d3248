#pragma once

#include <cstdint>
#include <string>

// What an HTTP transfer does with the server's answer. The transport calls
// it on the thread that called HttpGet.
class HttpResponseSink {
public:
    // statusText is the status code as text, or empty when it could not be
    // read. Returns false to end the transfer here.
    virtual bool OnResponse(const std::string& statusText, bool lengthKnown, uint32_t contentLength) = 0;
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
    NoResponse,  // the address could not be opened (name, connection, protocol)
    Abandoned,   // the sink turned down the response or a piece
    Stopped,     // KeepReading said no
    ReadFailed,  // the body broke off with an error
    Complete,    // the body ended
};

// GET of address as the program's agent, fresh from the server (never from
// a cache), through the system's configured proxy, following redirects.
HttpOutcome HttpGet(const std::string& address, HttpResponseSink& sink);
