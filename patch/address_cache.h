#pragma once

#include <cstdint>
#include <memory>
#include <vector>

#include "base/memory_stream.h"

// The near/same address cache of a delta: COPY addresses are stored as
// small offsets from recently used addresses. Reads the current window's
// addresses section.
class AddressCache {
public:
    // The sizes every delta without its own code table uses.
    static constexpr int32_t kDefaultNearSize = 4;
    static constexpr int32_t kDefaultSameSize = 3;

    AddressCache(int32_t nearSize, int32_t sameSize);
    AddressCache(const AddressCache&) = delete;
    AddressCache& operator=(const AddressCache&) = delete;
    virtual ~AddressCache() = default;

    // Changes the sizes; all slots start over.
    void Resize(int32_t nearSize, int32_t sameSize);
    // Clears every slot and starts reading addresses from the given section.
    void Reset(uint8_t* addresses, int32_t length);
    // The address of a COPY decoded in the given mode. here is the COPY's
    // own position in the segment-plus-window address space; an address at
    // or after it, or a mode past the cache, is rejected.
    uint32_t DecodeAddress(uint8_t mode, uint32_t here);
    // Bytes of the addresses section not read yet.
    int64_t Remaining() const;

private:
    void Remember(uint32_t address);

    int32_t nearSize = 0;
    int32_t sameSize = 0;
    std::vector<uint32_t> nearSlots;
    int32_t nextSlot = 0;
    std::vector<uint32_t> sameSlots;
    std::unique_ptr<MemoryStream> addressStream;
};
