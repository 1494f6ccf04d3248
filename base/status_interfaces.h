#pragma once

#include <cstdint>
#include <string>

// How the workers (the patch applier and the downloader) report what they
// are doing. The implementation must accept calls from the downloader's
// worker thread. Objects are never deleted through this interface, so its
// destructor is protected and not virtual.
class IStatusView {
public:
    // The applier works on fileName; permille is the batch's progress (0..1000).
    virtual void OnApplyProgress(const std::string& fileName, int32_t permille) = 0;
    // Called on the downloader's thread during a transfer.
    virtual void OnFileProgress(const std::string& localPath, uint32_t bytesDone, uint32_t bytesTotal) = 0;
    // Called on the downloader's thread after each transfer, whatever its
    // outcome; once for all the tries of a transfer that broke off.
    virtual void OnFileDone(const std::string& localPath) = 0;
    // Called on the downloader's thread when a transfer that broke off is
    // about to be tried again; the next OnFileProgress tells that data flows
    // again. A view without a status line may ignore it.
    virtual void OnFileRetrying(const std::string& localPath) { static_cast<void>(localPath); }

protected:
    IStatusView() = default;
    IStatusView(const IStatusView&) = default;
    IStatusView& operator=(const IStatusView&) = default;
    ~IStatusView() = default;
};

// How the window's thread stops the run when the player confirms a cancel.
class ICancelable {
public:
    virtual void Cancel() = 0;

protected:
    ICancelable() = default;
    ICancelable(const ICancelable&) = default;
    ICancelable& operator=(const ICancelable&) = default;
    ~ICancelable() = default;
};
