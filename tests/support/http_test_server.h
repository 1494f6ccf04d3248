#pragma once

#include <atomic>
#include <chrono>
#include <cstdint>
#include <map>
#include <mutex>
#include <string>
#include <thread>
#include <vector>

#include "tests/support/test_socket.h"

// How the server answers one path.
struct HttpTestResponse {
    int status = 200;
    std::string body;
    // Announce the body's length; without it the body ends when the
    // connection closes.
    bool sendLength = true;
    // Send only this many bytes of the (announced) body, then hang up.
    size_t breakOffAfter = std::string::npos;
    // Throttling: pieces of this size (0: the whole body at once) with a
    // pause after each, so a client's stop can land mid-transfer.
    size_t pieceSize = 0;
    std::chrono::milliseconds pause{0};
    // Serve only addresses signed as the update server expects ("e=" not
    // yet past, "h=" the digest of the shared secret and the address);
    // anything else gets 403.
    bool requireSignature = false;
};

// One request as the server saw it.
struct HttpTestRequest {
    std::string target;   // path and query
    std::string headers;  // the raw header lines, CR LF separated
    bool signatureValid = false;
    // The value of a header (name compared without regard to case).
    std::string Header(const std::string& name) const;
};

// An HTTP/1.1 server on 127.0.0.1 running on threads of the test program,
// so the same tests run natively and as Windows programs under Wine. Every
// response closes its connection. Unknown paths get 404.
class HttpTestServer {
public:
    HttpTestServer();
    HttpTestServer(const HttpTestServer&) = delete;
    HttpTestServer& operator=(const HttpTestServer&) = delete;
    ~HttpTestServer();

    // Answers requests for path (without query) with response.
    void Serve(const std::string& path, const HttpTestResponse& response);
    // Answers requests below prefix with the file of that name in folder,
    // read when asked for, with the status and pacing of behaviour; a
    // missing file gets 404.
    void ServeFolder(const std::string& prefix, const std::string& folder, const HttpTestResponse& behaviour);

    // "http://127.0.0.1:PORT" followed by path.
    std::string Url(const std::string& path) const;
    uint16_t Port() const { return port; }
    std::vector<HttpTestRequest> Requests() const;

    // The update server's check of a signed address: the text before "&h="
    // ends in "e=" and an expiry time not before now, and the digest after
    // "&h=" is that of the shared secret followed by that text.
    static bool SignatureValid(const std::string& url, int64_t now);

private:
    void AcceptLoop();
    void Answer(TestSocket connection);
    HttpTestResponse Lookup(const std::string& path);
    bool SendBody(TestSocket& connection, const std::string& body, const HttpTestResponse& response);

    struct Folder {
        std::string folder;
        HttpTestResponse behaviour;
    };

    uint16_t port = 0;
    TestSocket listener;
    std::atomic<bool> stopping{false};
    mutable std::mutex mutex;
    std::map<std::string, HttpTestResponse> routes;
    std::map<std::string, Folder> folders;
    std::vector<HttpTestRequest> requests;
    std::vector<std::thread> connections;
    std::thread acceptor;
};
