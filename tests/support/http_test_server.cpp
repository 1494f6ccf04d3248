#include "tests/support/http_test_server.h"

#include <algorithm>
#include <cctype>
#include <ctime>
#include <fstream>
#include <sstream>

#include "base/paths.h"
#include "net/md5.h"

namespace {

// The secret the update server shares with the updater.
const char kSharedSecret[] = "Kq7Vx2Rm9TbL4";
const int kTickMs = 20;
const size_t kMaximumHeaderSize = 64 * 1024;

const char* ReasonPhrase(int status) {
    switch (status) {
        case 200:
            return "OK";
        case 401:
            return "Unauthorized";
        case 403:
            return "Forbidden";
        case 404:
            return "Not Found";
        case 500:
            return "Internal Server Error";
        default:
            return "Status";
    }
}

std::string Lower(std::string text) {
    for (char& c : text) c = static_cast<char>(std::tolower(static_cast<unsigned char>(c)));
    return text;
}

}  // namespace

std::string HttpTestRequest::Header(const std::string& name) const {
    std::istringstream lines(headers);
    std::string line;
    const std::string wanted = Lower(name) + ":";
    while (std::getline(lines, line)) {
        if (!line.empty() && line.back() == '\r') line.pop_back();
        if (Lower(line.substr(0, wanted.size())) != wanted) continue;
        const size_t start = line.find_first_not_of(' ', wanted.size());
        return start == std::string::npos ? std::string() : line.substr(start);
    }
    return std::string();
}

HttpTestServer::HttpTestServer() : listener(TestSocket::ListenOnLoopback(port)) {
    acceptor = std::thread(&HttpTestServer::AcceptLoop, this);
}

HttpTestServer::~HttpTestServer() {
    stopping = true;
    acceptor.join();
    for (std::thread& connection : connections) connection.join();
}

void HttpTestServer::Serve(const std::string& path, const HttpTestResponse& response) {
    std::lock_guard<std::mutex> lock(mutex);
    routes[path] = response;
}

void HttpTestServer::ServeFolder(const std::string& prefix, const std::string& folder,
                                 const HttpTestResponse& behaviour) {
    std::lock_guard<std::mutex> lock(mutex);
    folders[prefix] = Folder{folder, behaviour};
}

std::string HttpTestServer::Url(const std::string& path) const {
    return "http://127.0.0.1:" + std::to_string(port) + path;
}

std::vector<HttpTestRequest> HttpTestServer::Requests() const {
    std::lock_guard<std::mutex> lock(mutex);
    return requests;
}

bool HttpTestServer::SignatureValid(const std::string& url, int64_t now) {
    const size_t digestAt = url.rfind("&h=");
    if (digestAt == std::string::npos) return false;
    const std::string signedPart = url.substr(0, digestAt);
    const size_t expiryAt = signedPart.rfind("e=");
    if (expiryAt == std::string::npos || expiryAt == 0 ||
        (signedPart[expiryAt - 1] != '?' && signedPart[expiryAt - 1] != '&')) {
        return false;
    }
    const std::string expiry = signedPart.substr(expiryAt + 2);
    if (expiry.empty() || expiry.size() > 18 || expiry.find_first_not_of("0123456789") != std::string::npos) {
        return false;
    }
    if (std::stoll(expiry) < now) return false;
    return url.substr(digestAt + 3) == Md5Hex(kSharedSecret + signedPart);
}

void HttpTestServer::AcceptLoop() {
    while (!stopping) {
        TestSocket connection = listener.Accept(kTickMs);
        if (!connection.IsValid()) continue;
        std::lock_guard<std::mutex> lock(mutex);
        connections.emplace_back(&HttpTestServer::Answer, this, std::move(connection));
    }
    listener.Close();
}

HttpTestResponse HttpTestServer::Lookup(const std::string& path) {
    std::lock_guard<std::mutex> lock(mutex);
    const auto route = routes.find(path);
    if (route != routes.end()) return route->second;
    for (const auto& entry : folders) {
        if (path.compare(0, entry.first.size(), entry.first) != 0) continue;
        const std::string name = path.substr(entry.first.size());
        if (name.empty() || name.find("..") != std::string::npos) break;
        std::ifstream file(PathJoin(entry.second.folder, name), std::ios::binary);
        if (!file) break;
        HttpTestResponse response = entry.second.behaviour;
        std::ostringstream content;
        content << file.rdbuf();
        response.body = content.str();
        return response;
    }
    HttpTestResponse missing;
    missing.status = 404;
    missing.body = "not found";
    return missing;
}

void HttpTestServer::Answer(TestSocket connection) {
    std::string head;
    char buffer[4096];
    while (head.find("\r\n\r\n") == std::string::npos) {
        if (stopping || head.size() > kMaximumHeaderSize) return;
        const int count = connection.Receive(buffer, sizeof(buffer), kTickMs);
        if (count == -2) continue;
        if (count <= 0) return;
        head.append(buffer, static_cast<size_t>(count));
    }
    HttpTestRequest request;
    const size_t lineEnd = head.find("\r\n");
    std::istringstream requestLine(head.substr(0, lineEnd));
    std::string method;
    requestLine >> method >> request.target;
    request.headers = head.substr(lineEnd + 2, head.find("\r\n\r\n") - lineEnd - 2);
    request.signatureValid =
        SignatureValid("http://" + request.Header("Host") + request.target, static_cast<int64_t>(std::time(nullptr)));
    {
        std::lock_guard<std::mutex> lock(mutex);
        requests.push_back(request);
    }

    HttpTestResponse response = Lookup(request.target.substr(0, request.target.find('?')));
    if (response.requireSignature && !request.signatureValid) {
        response = HttpTestResponse();
        response.status = 403;
        response.body = "bad signature";
    }
    std::ostringstream header;
    header << "HTTP/1.1 " << response.status << ' ' << ReasonPhrase(response.status) << "\r\n"
           << "Content-Type: application/octet-stream\r\n"
           << "Connection: close\r\n";
    if (response.sendLength) header << "Content-Length: " << response.body.size() << "\r\n";
    header << "\r\n";
    const std::string text = header.str();
    if (!connection.SendAll(text.data(), text.size())) return;
    if (method != "HEAD") SendBody(connection, response.body, response);
}

bool HttpTestServer::SendBody(TestSocket& connection, const std::string& body, const HttpTestResponse& response) {
    const size_t end = std::min(body.size(), response.breakOffAfter);
    const size_t piece = response.pieceSize == 0 ? end : response.pieceSize;
    for (size_t sent = 0; sent < end; sent += piece) {
        if (stopping) return false;
        if (!connection.SendAll(body.data() + sent, std::min(piece, end - sent))) return false;
        if (response.pause.count() > 0) std::this_thread::sleep_for(response.pause);
    }
    return true;
}
