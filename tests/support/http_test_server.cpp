#include "tests/support/http_test_server.h"

#include <algorithm>
#include <ctime>
#include <fstream>
#include <iterator>
#include <regex>

#include "base/paths.h"
#include "net/md5.h"

const char kSharedSecret[] = "Kq7Vx2Rm9TbL4";  // of the update server and the updater
const int kTickMs = 20;                        // how often a waiting thread looks at the stop flag

HttpTestServer::HttpTestServer() : listener(TestSocket::ListenOnLoopback(port)) {
    worker = std::thread([this] {
        while (!stopping) {
            if (listener.Readable(kTickMs)) Answer(listener.Accept());
        }
    });
}

HttpTestServer::~HttpTestServer() {
    stopping = true;
    worker.join();
}

void HttpTestServer::Serve(const std::string& path, const HttpTestResponse& response) {
    std::lock_guard<std::mutex> lock(mutex);
    routes[path] = response;
}

void HttpTestServer::ServeFolder(const std::string& prefix, const std::string& folder,
                                 const HttpTestResponse& behaviour) {
    std::lock_guard<std::mutex> lock(mutex);
    folders[prefix] = {folder, behaviour};
}

std::string HttpTestServer::Url(const std::string& path) const {
    return "http://127.0.0.1:" + std::to_string(port) + path;
}

std::vector<std::string> HttpTestServer::Requests() const {
    std::lock_guard<std::mutex> lock(mutex);
    return requests;
}

HttpTestResponse HttpTestServer::Lookup(const std::string& head, const std::string& path) {
    std::lock_guard<std::mutex> lock(mutex);
    requests.push_back(head);
    if (routes.count(path) != 0) return routes[path];
    for (const auto& [prefix, served] : folders) {
        const std::string name = path.substr(std::min(path.size(), prefix.size()));
        std::ifstream file(PathJoin(served.first, name), std::ios::binary);
        if (path.rfind(prefix, 0) != 0 || name.empty() || name.find("..") != std::string::npos || !file) continue;
        HttpTestResponse response = served.second;
        response.body.assign(std::istreambuf_iterator<char>(file), {});
        return response;
    }
    return HttpTestResponse{404, "not found"};
}

void HttpTestServer::Answer(const TestSocket& connection) {
    std::string head;
    char buffer[4096];
    while (head.find("\r\n\r\n") == std::string::npos) {
        if (stopping) return;
        if (!connection.Readable(kTickMs)) continue;
        const int count = connection.Receive(buffer, sizeof(buffer));
        if (count <= 0) return;
        head.append(buffer, static_cast<size_t>(count));
    }
    head.resize(head.find("\r\n\r\n") + 2);
    const size_t targetAt = head.find(' ') + 1;
    const std::string target = head.substr(targetAt, head.find(' ', targetAt) - targetAt);
    HttpTestResponse response = Lookup(head, target.substr(0, target.find('?')));
    // The update server's check: the query's last parameters are "e=" with an expiry not in the past, then "h=" with
    // the digest of the shared secret and everything before "&h=".
    static const std::regex form(R"(([^?]*\?([^?]*&)?e=([0-9]{1,18}))&h=([0-9a-f]{32}))");
    std::smatch parts;
    if (response.requireSignature &&
        !(std::regex_match(target, parts, form) && std::stoll(parts[3].str()) >= std::time(nullptr) &&
          parts[4].str() == Md5Hex(kSharedSecret + Url(parts[1].str())))) {
        response = HttpTestResponse{403, "bad signature"};
    }
    static const std::regex range("\r\nRange: bytes=([0-9]{1,18})-\r\n"), ifRange("\r\nIf-Range: ([^\r]*)\r\n");
    std::smatch asked, condition;
    std::string headers = response.etag.empty() ? "" : "ETag: " + response.etag + "\r\n";
    if (response.status == 200 && response.ranges && std::regex_search(head, asked, range) &&
        (!std::regex_search(head, condition, ifRange) || condition[1].str() == response.etag)) {
        const size_t from = std::stoull(asked[1].str()) + response.rangeSkew, size = response.body.size();
        response.status = 206;
        headers += "Content-Range: bytes " + std::to_string(from) + "-" + std::to_string(size - 1) + "/" +
                   std::to_string(size) + "\r\n";
        response.body.erase(0, std::min(from, size));
    }
    std::string reply = "HTTP/1.1 " + std::to_string(response.status) + " Test\r\nConnection: close\r\n" + headers;
    if (response.sendLength) reply += "Content-Length: " + std::to_string(response.body.size()) + "\r\n";
    reply += "\r\n" + response.body.substr(0, response.breakOffAfter);
    const size_t piece = response.pieceSize == 0 ? reply.size() : response.pieceSize;
    for (size_t sent = 0; sent < reply.size() && !stopping; sent += piece) {
        if (!connection.SendAll(reply.data() + sent, std::min(piece, reply.size() - sent))) return;
        std::this_thread::sleep_for(response.pause);
    }
    // The client's hang-up makes the connection readable.
    while (response.stallAtBreak && response.breakOffAfter < response.body.size() && !stopping &&
           !connection.Readable(kTickMs)) {
    }
}
