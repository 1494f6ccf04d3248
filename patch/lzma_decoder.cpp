#include "patch/lzma_decoder.h"

#include <LzmaDec.h>

#include <algorithm>
#include <cstdlib>
#include <memory>

#include "base/cancellation.h"
#include "base/exception.h"
#include "base/file_stream.h"
#include "base/memory_budget.h"

namespace {

constexpr uint32_t kBufferSize = 65536;
constexpr int kHeaderSize = LZMA_PROPS_SIZE + 8;

void* HeapAlloc(void*, size_t size) { return size == 0 ? nullptr : std::malloc(size); }
void HeapFree(void*, void* address) { std::free(address); }
ISzAlloc heapAllocator = {HeapAlloc, HeapFree};

// Owns the decoder state so that a stream error thrown mid-loop frees it.
class DecoderState {
public:
    DecoderState() { LzmaDec_Construct(&state); }
    DecoderState(const DecoderState&) = delete;
    DecoderState& operator=(const DecoderState&) = delete;
    ~DecoderState() { LzmaDec_Free(&state, &heapAllocator); }

    CLzmaDec* operator->() { return &state; }
    CLzmaDec* get() { return &state; }

private:
    CLzmaDec state;
};

// Cuts the dictionary the header asks for to the unpacked size, when that
// is given; false when what remains is beyond kMaximumLzmaDictionarySize.
bool LimitDictionary(uint8_t* properties, bool sizeKnown, uint64_t unpackedSize) {
    uint32_t dictionary = static_cast<uint32_t>(properties[1]) | (static_cast<uint32_t>(properties[2]) << 8) |
                          (static_cast<uint32_t>(properties[3]) << 16) | (static_cast<uint32_t>(properties[4]) << 24);
    if (sizeKnown && unpackedSize < dictionary) dictionary = static_cast<uint32_t>(unpackedSize);
    if (dictionary > kMaximumLzmaDictionarySize) return false;
    for (int i = 0; i < 4; ++i) properties[1 + i] = static_cast<uint8_t>(dictionary >> (8 * i));
    return true;
}

}  // namespace

const char* LzmaResultText(int result) {
    switch (result) {
        case SZ_ERROR_DATA:
            return "Data error, please verify that downloaded files are complete and correct!";
        case SZ_ERROR_MEM:
            return "Memory allocation error, please check available memory";
        case SZ_ERROR_CRC:
            return "SZ_ERROR_CRC";
        case SZ_ERROR_UNSUPPORTED:
            return "Unsupported properties";
        case SZ_ERROR_PARAM:
            return "SZ_ERROR_PARAM";
        case SZ_ERROR_INPUT_EOF:
            return "Missing data, please verify that downloaded files are complete!";
        case SZ_ERROR_OUTPUT_EOF:
            return "SZ_ERROR_OUTPUT_EOF";
        case SZ_ERROR_READ:
            return "SZ_ERROR_READ";
        case SZ_ERROR_WRITE:
            return "SZ_ERROR_WRITE";
        case SZ_ERROR_PROGRESS:
            return "SZ_ERROR_PROGRESS";
        case SZ_ERROR_FAIL:
            return "SZ_ERROR_FAIL";
        case SZ_ERROR_THREAD:
            return "SZ_ERROR_THREAD";
        default:
            return "Failed to decode LZMA data.";
    }
}

void DecodeLzma(FileStream& input, FileStream& output, const CancellationToken* cancel, MemoryBudget* budget) {
    uint8_t header[kHeaderSize];
    // A stream too short to hold its own header is missing data, not a
    // header of zeros.
    if (input.Read(header, kHeaderSize) < kHeaderSize) throw Exception(LzmaResultText(SZ_ERROR_INPUT_EOF));
    uint64_t unpackedSize = 0;
    bool sizeKnown = false;
    for (int i = 0; i < 8; ++i) {
        const uint8_t byte = header[LZMA_PROPS_SIZE + i];
        if (byte != 0xFF) sizeKnown = true;
        unpackedSize |= static_cast<uint64_t>(byte) << (8 * i);
    }

    if (!LimitDictionary(header, sizeKnown, unpackedSize)) {
        throw Exception("Failed to allocate LZMA structures while decoding.");
    }
    const uint32_t dictionary =
        uint32_t{header[1]} | uint32_t{header[2]} << 8 | uint32_t{header[3]} << 16 | uint32_t{header[4]} << 24;
    // The dictionary, the two buffers and the decoder's probability tables.
    const MemoryBudget::Reservation memory(budget, uint64_t{dictionary} + 2 * kBufferSize + (1 << 20));
    DecoderState state;
    if (LzmaDec_Allocate(state.get(), header, LZMA_PROPS_SIZE, &heapAllocator) != SZ_OK) {
        throw Exception("Failed to allocate LZMA structures while decoding.");
    }
    LzmaDec_Init(state.get());

    std::unique_ptr<uint8_t[]> inBuffer(new uint8_t[kBufferSize]);
    std::unique_ptr<uint8_t[]> outBuffer(new uint8_t[kBufferSize]);
    size_t inPosition = 0;
    size_t inSize = 0;
    uint64_t remaining = unpackedSize;
    SRes result = SZ_OK;
    for (;;) {
        // A stopped extraction is a cancel, never a finished file: the
        // caller must not take the cut-off output for the member.
        if (IsCancelled(cancel)) throw Exception("", ErrorCode::UserCancelled);
        if (inPosition == inSize) {
            inSize = input.Read(inBuffer.get(), kBufferSize);
            inPosition = 0;
        }
        SizeT outProcessed = kBufferSize;
        ELzmaFinishMode finishMode = LZMA_FINISH_ANY;
        if (sizeKnown && remaining < kBufferSize) {
            outProcessed = static_cast<SizeT>(remaining);
            finishMode = LZMA_FINISH_END;
        }
        SizeT inProcessed = inSize - inPosition;
        ELzmaStatus status = LZMA_STATUS_NOT_SPECIFIED;
        result = LzmaDec_DecodeToBuf(state.get(), outBuffer.get(), &outProcessed, inBuffer.get() + inPosition,
                                     &inProcessed, finishMode, &status);
        inPosition += inProcessed;
        remaining -= outProcessed;
        output.Write(outBuffer.get(), static_cast<uint32_t>(outProcessed));
        if (result != SZ_OK) break;
        if (sizeKnown && remaining == 0) break;
        if (inProcessed == 0 && outProcessed == 0) {
            if (sizeKnown || status != LZMA_STATUS_FINISHED_WITH_MARK) result = SZ_ERROR_DATA;
            break;
        }
    }
    if (result != SZ_OK) throw Exception(LzmaResultText(result));
}
