#pragma once

#include <cstdint>

class CancellationToken;
class FileStream;
class MemoryBudget;

// The largest dictionary a stream may make us allocate: 1.5 GiB, the most
// the xz tools write into a stand-alone LZMA header (the SDK encoder stops
// at 1 GiB). The dictionary a header asks for is first cut to the unpacked
// size when the header gives it (a stream never refers back further than
// it has produced); a request still larger is refused before anything is
// allocated, so a hostile header cannot make us ask the heap for 4 GiB.
constexpr uint32_t kMaximumLzmaDictionarySize = (1u << 30) + (1u << 29);

// Decodes one LZMA stream in the stand-alone layout (5 property bytes, the
// 64-bit unpacked size or all ones when the data ends with an end marker,
// then the compressed data) from input's current position into output.
// Works in fixed 64 KiB steps: memory is the two buffers plus the
// dictionary, whatever the size of the data. Throws Exception on failure;
// what was decoded before the failure stays written. A cancel (cancel may
// be null) is noticed at every step and ends with UserCancelled, leaving
// the output incomplete. With a budget (may be null), the dictionary and
// buffers are reserved from it before they are allocated.
void DecodeLzma(FileStream& input, FileStream& output, const CancellationToken* cancel = nullptr,
                MemoryBudget* budget = nullptr);

// The text shown for an LZMA SDK result code.
const char* LzmaResultText(int result);
