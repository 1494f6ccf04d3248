#pragma once

#include <atomic>

#include "base/exception.h"

// The player's cancel, the one flag of a run: the window sets it once, and
// every worker reads it where it can stop cleanly (the downloader between
// pieces, the LZMA and VCDIFF loops at every step, the applier between
// files). A token may be linked to another: it is then cancelled when that
// one is, so a worker's own stop (the downloader's, which the run also
// uses to end transfers it no longer needs) can never outlive the run's
// cancel. Whoever waits for something other than a token must be woken by
// the canceller.
class CancellationToken {
public:
    explicit CancellationToken(const CancellationToken* linked = nullptr) : linkedTo(linked) {}
    CancellationToken(const CancellationToken&) = delete;
    CancellationToken& operator=(const CancellationToken&) = delete;

    void Cancel() { cancelled.store(true, std::memory_order_relaxed); }
    // Clears this token's own cancel, never the one it is linked to.
    void Reset() { cancelled.store(false, std::memory_order_relaxed); }
    bool IsCancelled() const {
        return cancelled.load(std::memory_order_relaxed) || (linkedTo != nullptr && linkedTo->IsCancelled());
    }
    // Throws UserCancelled with what when cancelled.
    void ThrowIfCancelled(const char* what) const {
        if (IsCancelled()) throw Exception(what, ErrorCode::UserCancelled);
    }

private:
    std::atomic<bool> cancelled{false};
    const CancellationToken* const linkedTo;
};

// True when token is given and cancelled.
inline bool IsCancelled(const CancellationToken* token) { return token != nullptr && token->IsCancelled(); }
