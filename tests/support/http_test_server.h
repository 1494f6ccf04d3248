#pragma once

#include <atomic>
#include <chrono>
#include <map>
#include <mutex>
#include <string>
#include <thread>
#include <vector>

#include "tests/support/test_socket.h"

// How the server answers a path.
struct HttpTestResponse {
    int status = 200;
    std::string body;
    bool sendLength = true;                    // without it the body ends when the connection closes
    size_t breakOffAfter = std::string::npos;  // hang up after this much of the body
    size_t pieceSize = 0;                      // with a pause after each (0: all at once), so a stop lands mid-transfer
    std::chrono::milliseconds pause{0};
    bool requireSignature = false;  // answer 403 unless the address is signed
    std::string etag{};             // sent as the ETag when not empty
    // "Range: bytes=N-" gets 206 and the rest from N, unless If-Range names another ETag; a broken server's rest
    // starts rangeSkew bytes later than asked.
    bool ranges = true;
    size_t rangeSkew = 0;
    bool stallAtBreak = false;  // at breakOffAfter, hold the connection without a byte until the client hangs up
};

// An HTTP/1.1 server on 127.0.0.1 on a thread of the test program, so the same tests run natively and under Wine. One
// connection at a time, each closed after its response; unknown paths get 404.
class HttpTestServer {
public:
    HttpTestServer();
    ~HttpTestServer();

    void Serve(const std::string& path, const HttpTestResponse& response);  // the path without its query
    // Below prefix: the file of that name in folder, read when asked for, sent as behaviour says.
    void ServeFolder(const std::string& prefix, const std::string& folder, const HttpTestResponse& behaviour);
    std::string Url(const std::string& path) const;  // "http://127.0.0.1:PORT" followed by path
    std::vector<std::string> Requests() const;       // the request line and headers of each request so far

private:
    void Answer(const TestSocket& connection);
    HttpTestResponse Lookup(const std::string& head, const std::string& path);  // records the request too

    uint16_t port = 0;
    TestSocket listener;
    std::atomic<bool> stopping{false};
    mutable std::mutex mutex;
    std::map<std::string, HttpTestResponse> routes;
    std::map<std::string, std::pair<std::string, HttpTestResponse>> folders;
    std::vector<std::string> requests;
    std::thread worker;
};
