#pragma once

#include <condition_variable>
#include <mutex>

// An event that lets one waiter through per signal and then closes again
// by itself; signals given while nobody waits are kept (once).
class AutoResetEvent {
public:
    void Signal();
    // Blocks until the event is signalled, and resets it.
    void Wait();

private:
    std::mutex mutex;
    std::condition_variable condition;
    bool signalled = false;
};
