#pragma once

#include <cstddef>
#include <cstdint>

// The few socket calls the loopback test server needs, over Winsock or BSD
// sockets. Failures of setting up throw std::runtime_error.
class TestSocket {
public:
    TestSocket() = default;
    TestSocket(TestSocket&& other) noexcept : handle(other.handle) { other.handle = -1; }
    TestSocket& operator=(TestSocket&& other) noexcept {
        if (this != &other) {
            Close();
            handle = other.handle;
            other.handle = -1;
        }
        return *this;
    }
    TestSocket(const TestSocket&) = delete;
    TestSocket& operator=(const TestSocket&) = delete;
    ~TestSocket() { Close(); }

    // A socket listening on 127.0.0.1 at a port the system chose.
    static TestSocket ListenOnLoopback(uint16_t& port);

    bool IsValid() const { return handle != -1; }
    // A connection, or an invalid socket when none came within timeoutMs.
    TestSocket Accept(int timeoutMs);
    // Bytes received (> 0), 0 when the peer closed, -1 on an error, -2 when
    // nothing came within timeoutMs.
    int Receive(char* buffer, size_t size, int timeoutMs);
    // False when the peer has gone.
    bool SendAll(const char* data, size_t size);
    // Tells the peer that nothing more will be sent, then closes.
    void Close();

private:
    explicit TestSocket(intptr_t value) : handle(value) {}
    static bool WaitReadable(intptr_t value, int timeoutMs);

    intptr_t handle = -1;
};
