#include <arpa/inet.h>
#include <netinet/in.h>
#include <poll.h>
#include <sys/socket.h>
#include <unistd.h>

#include <cerrno>
#include <stdexcept>

#include "tests/support/test_socket.h"

TestSocket TestSocket::ListenOnLoopback(uint16_t& port) {
    const int fd = ::socket(AF_INET, SOCK_STREAM | SOCK_CLOEXEC, 0);
    if (fd < 0) throw std::runtime_error("socket failed");
    TestSocket listener(fd);
    sockaddr_in address = {};
    address.sin_family = AF_INET;
    address.sin_addr.s_addr = htonl(INADDR_LOOPBACK);
    address.sin_port = 0;
    socklen_t size = sizeof(address);
    if (::bind(fd, reinterpret_cast<sockaddr*>(&address), sizeof(address)) != 0 || ::listen(fd, 16) != 0 ||
        ::getsockname(fd, reinterpret_cast<sockaddr*>(&address), &size) != 0) {
        throw std::runtime_error("cannot listen on 127.0.0.1");
    }
    port = ntohs(address.sin_port);
    return listener;
}

bool TestSocket::WaitReadable(intptr_t value, int timeoutMs) {
    pollfd entry = {static_cast<int>(value), POLLIN, 0};
    int result;
    do {
        result = ::poll(&entry, 1, timeoutMs);
    } while (result < 0 && errno == EINTR);
    return result > 0;
}

TestSocket TestSocket::Accept(int timeoutMs) {
    if (!IsValid() || !WaitReadable(handle, timeoutMs)) return TestSocket();
    const int fd = ::accept4(static_cast<int>(handle), nullptr, nullptr, SOCK_CLOEXEC);
    return fd < 0 ? TestSocket() : TestSocket(fd);
}

int TestSocket::Receive(char* buffer, size_t size, int timeoutMs) {
    if (!IsValid()) return -1;
    if (!WaitReadable(handle, timeoutMs)) return -2;
    const ssize_t count = ::recv(static_cast<int>(handle), buffer, size, 0);
    return count < 0 ? -1 : static_cast<int>(count);
}

bool TestSocket::SendAll(const char* data, size_t size) {
    while (size > 0) {
        // MSG_NOSIGNAL: a client that hung up must not kill the test program.
        const ssize_t sent = ::send(static_cast<int>(handle), data, size, MSG_NOSIGNAL);
        if (sent < 0 && errno == EINTR) continue;
        if (sent <= 0) return false;
        data += sent;
        size -= static_cast<size_t>(sent);
    }
    return true;
}

void TestSocket::Close() {
    if (!IsValid()) return;
    ::shutdown(static_cast<int>(handle), SHUT_WR);
    ::close(static_cast<int>(handle));
    handle = -1;
}
