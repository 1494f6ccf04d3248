#include <winsock2.h>
#include <ws2tcpip.h>

#include <stdexcept>

#include "tests/support/test_socket.h"

namespace {

void StartWinsockOnce() {
    static const bool started = [] {
        WSADATA data;
        return WSAStartup(MAKEWORD(2, 2), &data) == 0;
    }();
    if (!started) throw std::runtime_error("WSAStartup failed");
}

SOCKET Native(intptr_t value) { return static_cast<SOCKET>(value); }

}  // namespace

TestSocket TestSocket::ListenOnLoopback(uint16_t& port) {
    StartWinsockOnce();
    const SOCKET native = ::socket(AF_INET, SOCK_STREAM, IPPROTO_TCP);
    if (native == INVALID_SOCKET) throw std::runtime_error("socket failed");
    TestSocket listener(static_cast<intptr_t>(native));
    sockaddr_in address = {};
    address.sin_family = AF_INET;
    address.sin_addr.s_addr = htonl(INADDR_LOOPBACK);
    address.sin_port = 0;
    int size = sizeof(address);
    if (::bind(native, reinterpret_cast<sockaddr*>(&address), sizeof(address)) != 0 || ::listen(native, 16) != 0 ||
        ::getsockname(native, reinterpret_cast<sockaddr*>(&address), &size) != 0) {
        throw std::runtime_error("cannot listen on 127.0.0.1");
    }
    port = ntohs(address.sin_port);
    return listener;
}

bool TestSocket::WaitReadable(intptr_t value, int timeoutMs) {
    fd_set readable;
    FD_ZERO(&readable);
    FD_SET(Native(value), &readable);
    timeval limit = {timeoutMs / 1000, (timeoutMs % 1000) * 1000};
    return ::select(0, &readable, nullptr, nullptr, &limit) > 0;
}

TestSocket TestSocket::Accept(int timeoutMs) {
    if (!IsValid() || !WaitReadable(handle, timeoutMs)) return TestSocket();
    const SOCKET native = ::accept(Native(handle), nullptr, nullptr);
    return native == INVALID_SOCKET ? TestSocket() : TestSocket(static_cast<intptr_t>(native));
}

int TestSocket::Receive(char* buffer, size_t size, int timeoutMs) {
    if (!IsValid()) return -1;
    if (!WaitReadable(handle, timeoutMs)) return -2;
    const int count = ::recv(Native(handle), buffer, static_cast<int>(size), 0);
    return count == SOCKET_ERROR ? -1 : count;
}

bool TestSocket::SendAll(const char* data, size_t size) {
    while (size > 0) {
        const int sent = ::send(Native(handle), data, static_cast<int>(size), 0);
        if (sent == SOCKET_ERROR || sent == 0) return false;
        data += sent;
        size -= static_cast<size_t>(sent);
    }
    return true;
}

void TestSocket::Close() {
    if (!IsValid()) return;
    ::shutdown(Native(handle), SD_SEND);
    ::closesocket(Native(handle));
    handle = -1;
}
