#include <arpa/inet.h>
#include <poll.h>
#include <sys/socket.h>
#include <unistd.h>

#include <stdexcept>

#include "tests/support/test_socket.h"

TestSocket TestSocket::ListenOnLoopback(uint16_t& port) {
    TestSocket listener(::socket(AF_INET, SOCK_STREAM | SOCK_CLOEXEC, 0));
    const int fd = static_cast<int>(listener.handle.Get());
    sockaddr_in address = {};
    address.sin_family = AF_INET;
    address.sin_addr.s_addr = htonl(INADDR_LOOPBACK);
    sockaddr* const raw = reinterpret_cast<sockaddr*>(&address);
    socklen_t size = sizeof(address);
    if (fd < 0 || ::bind(fd, raw, size) != 0 || ::listen(fd, 16) != 0 || ::getsockname(fd, raw, &size) != 0) {
        throw std::runtime_error("cannot listen on 127.0.0.1");
    }
    port = ntohs(address.sin_port);
    return listener;
}

bool TestSocket::Readable(int timeoutMs) const {
    pollfd entry = {static_cast<int>(handle.Get()), POLLIN, 0};
    return ::poll(&entry, 1, timeoutMs) > 0;
}

TestSocket TestSocket::Accept() const { return TestSocket(::accept(static_cast<int>(handle.Get()), nullptr, nullptr)); }

int TestSocket::Receive(char* buffer, size_t size) const {
    return ::recv(static_cast<int>(handle.Get()), buffer, size, 0);
}

bool TestSocket::SendAll(const char* data, size_t size) const {
    // A blocking send returns once all is sent. MSG_NOSIGNAL: a client that hung up must not kill the test program.
    return ::send(static_cast<int>(handle.Get()), data, size, MSG_NOSIGNAL) == static_cast<ssize_t>(size);
}

void TestSocket::Traits::Close(intptr_t value) {
    ::shutdown(static_cast<int>(value), SHUT_WR);
    ::close(static_cast<int>(value));
}
