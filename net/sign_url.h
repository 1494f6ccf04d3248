#pragma once

#include <cstdint>
#include <string>

// The offset between the update server's clock and ours, in seconds. The
// run publishes it once from its command line; any thread may read it.
void SetServerClockOffset(int64_t seconds);
int64_t GetServerClockOffset();
// The server's clock now: ours and the offset, in seconds since 1970.
int64_t ServerTimeNow();

// Appends an expiry time one hour ahead (by the server's clock) as "e=" and
// a digest of the secret shared with the server and the signed address as
// "h=", so the server serves only addresses this program produced.
std::string SignUrl(const std::string& url);
