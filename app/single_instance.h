#pragma once

#include <cstdint>

#include "base/unique_handle.h"

// Keeps a second, non-elevated updater out. Windows: the named mutex
// "IronvaleUpdater"; POSIX: an exclusive lock on a file in the temporary
// folder. Released when the object goes away.
class SingleInstance {
public:
    // True when this process now holds the guard. A guard abandoned by a
    // crashed owner counts as held by another instance.
    [[nodiscard]] bool Acquire();
    void Release() { guard.Reset(); }

private:
    // The mutex (a Win32 HANDLE) or the lock file's descriptor; -1 for none.
    struct Traits {
        using Value = intptr_t;
        static Value Invalid() { return -1; }
        static void Close(Value value);
    };
    UniqueHandle<Traits> guard;
};

extern const char* const kInstanceName;
