#include "net/auto_reset_event.h"

void AutoResetEvent::Signal() {
    {
        std::lock_guard<std::mutex> lock(mutex);
        signalled = true;
    }
    condition.notify_one();
}

void AutoResetEvent::Wait() {
    std::unique_lock<std::mutex> lock(mutex);
    condition.wait(lock, [this] { return signalled; });
    signalled = false;
}
