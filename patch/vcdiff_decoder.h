#pragma once

#include <cstdint>
#include <memory>

#include "patch/address_cache.h"
#include "patch/code_table.h"

class CancellationToken;
class FileStream;
class MemoryStream;

// Rebuilds a file from its old version (the source) and a VCDIFF delta
// (RFC 3284) as xdelta3 writes it with -S none: default or delta-defined
// code tables, source and target segments, and xdelta3's Adler-32 of each
// target window. Secondary compressors and compressed sections are refused.
//
// Every size in a delta is untrusted. Before anything is allocated, a window
// is refused when
// - its segment is longer than kMaxSegmentLength, or lies outside the source
//   (or outside the target written so far),
// - its target window is longer than kMaxTargetWindowLength,
// - its delta encoding is longer than kMaxDeltaEncodingLength or than what is
//   left of the delta, or its section lengths do not add up to it.
// Memory therefore follows the window sizes, never the file sizes.
class VcdiffDecoder {
public:
    // xdelta3 3.0 never writes a target window above 16 MiB (its hard
    // limit); later builds allow 64 MiB.
    static constexpr uint32_t kMaxTargetWindowLength = 64u << 20;
    // xdelta3 keeps a window's source segment within its -B setting (1 GiB at
    // the most we support), and a match found near the end of that range runs
    // on by at most one target window.
    static constexpr uint32_t kMaxSegmentLength = (1u << 30) + kMaxTargetWindowLength;
    // Far above any real window: an encoding that adds every byte is little
    // longer than its target window. The delta's own length is a further
    // bound, so allocations never exceed the bytes actually delivered.
    static constexpr uint32_t kMaxDeltaEncodingLength = 16 * kMaxTargetWindowLength;

    // The streams are borrowed for the decoder's lifetime.
    VcdiffDecoder(FileStream* source, FileStream* delta, FileStream* target);
    VcdiffDecoder(const VcdiffDecoder&) = delete;
    VcdiffDecoder& operator=(const VcdiffDecoder&) = delete;
    virtual ~VcdiffDecoder();

    // Decodes the whole delta; does nothing if any stream is missing. Every
    // failure is an Exception; windows written before it stay written. A
    // cancel (cancel may be null) is noticed before each window.
    static void Decode(FileStream* source, FileStream* delta, FileStream* target,
                       const CancellationToken* cancel = nullptr);
    // The bytes decoding the delta will hold at most (its largest window of
    // each kind), read from the window headers alone; the delta is left at
    // its start. A delta the headers do not describe well gets the largest
    // window added: the decode itself reports what is wrong with it.
    static uint64_t MemoryNeed(FileStream* source, FileStream* delta);

    void ReadHeader();
    void ReadCodeTable();
    // False at the clean end of the delta.
    bool DecodeWindow();

private:
    // Grows to the largest window seen and is reused, so a file of many
    // windows costs one allocation per buffer.
    class Buffer {
    public:
        uint8_t* Reserve(uint32_t size);

    private:
        std::unique_ptr<uint8_t[]> bytes;
        uint32_t capacity = 0;
    };

    struct Window;

    void ReadWindowHeader(uint8_t indicator, Window& window);
    void ReadSegment(Window& window);
    void ReadSections(Window& window);
    void RunInstructions(Window& window);
    void Execute(const Instruction& instruction, MemoryStream& instructions, Window& window);
    void CopyFromSegment(Window& window, uint32_t address, uint32_t size);
    void CopyWithinWindow(Window& window, uint32_t offset, uint32_t size);
    void FinishWindow(Window& window);
    void SkipDeltaBytes(uint32_t count);
    // Throws unless count bytes are left in the delta.
    void RequireDeltaBytes(uint32_t count, const char* what);

    FileStream* source;
    FileStream* delta;
    FileStream* target;
    std::unique_ptr<AddressCache> addressCache;
    const CodeTable* codeTable;
    std::unique_ptr<CodeTable> ownCodeTable;
    // A code table arrives as a delta of its own, which may not nest another.
    bool codeTableAllowed = true;
    Buffer segmentBuffer;
    Buffer windowBuffer;
    Buffer dataBuffer;
    Buffer instructionsBuffer;
    Buffer addressesBuffer;
};
