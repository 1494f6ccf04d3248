#include <winsock2.h>

#include <stdexcept>

#include "tests/support/test_socket.h"

TestSocket TestSocket::ListenOnLoopback(uint16_t& port) {
    WSADATA data;  // counted: each start is one more user of Winsock
    const bool started = WSAStartup(MAKEWORD(2, 2), &data) == 0;
    const SOCKET native = started ? ::socket(AF_INET, SOCK_STREAM, IPPROTO_TCP) : INVALID_SOCKET;
    TestSocket listener(static_cast<intptr_t>(native));
    sockaddr_in address = {};
    address.sin_family = AF_INET;
    address.sin_addr.s_addr = htonl(INADDR_LOOPBACK);
    sockaddr* const raw = reinterpret_cast<sockaddr*>(&address);
    int size = sizeof(address);
    if (native == INVALID_SOCKET || ::bind(native, raw, size) != 0 || ::listen(native, 16) != 0 ||
        ::getsockname(native, raw, &size) != 0) {
        throw std::runtime_error("cannot listen on 127.0.0.1");
    }
    port = ntohs(address.sin_port);
    return listener;
}

bool TestSocket::Readable(int timeoutMs) const {
    WSAPOLLFD entry = {static_cast<SOCKET>(handle.Get()), POLLRDNORM, 0};
    return WSAPoll(&entry, 1, timeoutMs) > 0;
}

TestSocket TestSocket::Accept() const {
    return TestSocket(static_cast<intptr_t>(::accept(static_cast<SOCKET>(handle.Get()), nullptr, nullptr)));
}

int TestSocket::Receive(char* buffer, size_t size) const {
    return ::recv(static_cast<SOCKET>(handle.Get()), buffer, static_cast<int>(size), 0);
}

bool TestSocket::SendAll(const char* data, size_t size) const {
    // A blocking send returns once all is sent.
    return ::send(static_cast<SOCKET>(handle.Get()), data, static_cast<int>(size), 0) == static_cast<int>(size);
}

void TestSocket::Traits::Close(intptr_t value) {
    ::shutdown(static_cast<SOCKET>(value), SD_SEND);
    ::closesocket(static_cast<SOCKET>(value));
}
