#pragma once

#include <cstddef>
#include <cstdint>

#include "base/unique_handle.h"

// The socket calls the loopback test server needs, over Winsock or BSD sockets. The socket closes when its object goes.
class TestSocket {
public:
    // Listens on 127.0.0.1 at a port the system chose; throws std::runtime_error when it cannot.
    static TestSocket ListenOnLoopback(uint16_t& port);
    bool Readable(int timeoutMs) const;  // a connection, data or a hang-up waits
    TestSocket Accept() const;
    int Receive(char* buffer, size_t size) const;  // 0 or less: the peer has gone
    bool SendAll(const char* data, size_t size) const;
    void Close() { handle.Reset(); }

private:
    // A SOCKET or a descriptor; -1 (INVALID_SOCKET) for none.
    struct Traits {
        using Value = intptr_t;
        static Value Invalid() { return -1; }
        static void Close(Value value);  // tells the peer that nothing more comes, then closes
    };

    explicit TestSocket(intptr_t value) : handle(value) {}

    UniqueHandle<Traits> handle;
};
