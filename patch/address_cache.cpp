#include "patch/address_cache.h"

#include <algorithm>
#include <string>

#include "base/exception.h"
#include "base/stream_readers.h"

namespace {

constexpr int32_t kSameBlock = 256;

}  // namespace

AddressCache::AddressCache(int32_t near, int32_t same) { Resize(near, same); }

void AddressCache::Resize(int32_t near, int32_t same) {
    nearSize = near;
    sameSize = same;
    nearSlots.assign(static_cast<size_t>(near), 0);
    sameSlots.assign(static_cast<size_t>(same) * kSameBlock, 0);
    nextSlot = 0;
}

void AddressCache::Reset(uint8_t* addresses, int32_t length) {
    std::fill(nearSlots.begin(), nearSlots.end(), 0);
    std::fill(sameSlots.begin(), sameSlots.end(), 0);
    nextSlot = 0;
    if (!addressStream) addressStream = std::make_unique<MemoryStream>();
    addressStream->Attach(addresses, length);
}

int64_t AddressCache::Remaining() const {
    return addressStream ? addressStream->GetLength() - addressStream->GetPosition() : 0;
}

uint32_t AddressCache::DecodeAddress(uint8_t mode, uint32_t here) {
    // 64 bits, so that a near slot plus a large offset cannot wrap round to
    // a plausible address.
    uint64_t address;
    if (mode == 0) {
        address = ReadBigEndian7BitEncodedInt(addressStream.get());
    } else if (mode == 1) {
        const uint32_t back = ReadBigEndian7BitEncodedInt(addressStream.get());
        if (back > here) {
            throw Exception("VcdiffDecoder: COPY address lies " + std::to_string(back) + " bytes back from position " +
                            std::to_string(here) + ", before the start of the segment.");
        }
        address = here - back;
    } else if (mode - 2 < nearSize) {
        address = uint64_t{nearSlots[mode - 2]} + ReadBigEndian7BitEncodedInt(addressStream.get());
    } else if (mode - 2 - nearSize < sameSize) {
        const int32_t block = mode - 2 - nearSize;
        address = sameSlots[static_cast<size_t>(block) * kSameBlock + CheckedReadByte(addressStream.get())];
    } else {
        throw Exception("VcdiffDecoder: COPY address mode " + std::to_string(mode) + " is past the " +
                        std::to_string(nearSize) + " near and " + std::to_string(sameSize) + " same cache slots.");
    }
    if (address >= here) {
        throw Exception("VcdiffDecoder: COPY address " + std::to_string(address) +
                        " is at or after the current position " + std::to_string(here) + ".");
    }
    Remember(static_cast<uint32_t>(address));
    return static_cast<uint32_t>(address);
}

void AddressCache::Remember(uint32_t address) {
    if (nearSize > 0) {
        nearSlots[nextSlot] = address;
        nextSlot = (nextSlot + 1) % nearSize;
    }
    if (sameSize > 0) sameSlots[address % (static_cast<uint32_t>(sameSize) * kSameBlock)] = address;
}
