#include "net/sign_url.h"

#include <atomic>
#include <ctime>

#include "net/md5.h"

namespace {

// Agreed with the update server, which computes the same digest.
const char kSharedSecret[] = "Kq7Vx2Rm9TbL4";
static_assert(sizeof(kSharedSecret) == 14, "the secret is 13 characters");

std::atomic<int64_t> serverClockOffset{0};

}  // namespace

void SetServerClockOffset(int64_t seconds) { serverClockOffset = seconds; }

int64_t GetServerClockOffset() { return serverClockOffset; }

int64_t ServerTimeNow() { return static_cast<int64_t>(std::time(nullptr)) + serverClockOffset; }

std::string SignUrl(const std::string& url) {
    const int64_t expiry = ServerTimeNow() + 3600;
    const char* separator = url.find('?') == std::string::npos ? "?" : "&";
    const std::string signedUrl = url + separator + "e=" + std::to_string(expiry);
    return signedUrl + "&h=" + Md5Hex(kSharedSecret + signedUrl);
}
