#pragma once

// Keeps a second, non-elevated updater out. Windows: the named mutex
// "IronvaleUpdater"; POSIX: an exclusive lock on a file in the temporary
// folder. Released when the object goes away.
class SingleInstance {
public:
    SingleInstance() = default;
    SingleInstance(const SingleInstance&) = delete;
    SingleInstance& operator=(const SingleInstance&) = delete;
    ~SingleInstance() { Release(); }

    // True when this process now holds the guard. A guard abandoned by a
    // crashed owner counts as held by another instance.
    bool Acquire();
    void Release();

private:
    long long handle = -1;
};

extern const char* const kInstanceName;
