#include "patch/vcdiff_decoder.h"

#include <algorithm>
#include <cstring>
#include <new>
#include <string>

#include "base/cancellation.h"
#include "base/exception.h"
#include "base/file_stream.h"
#include "base/memory_stream.h"
#include "base/stream_readers.h"
#include "patch/checksum.h"

namespace {

constexpr uint8_t kMagic[3] = {0xD6, 0xC3, 0xC4};

// Header indicator bits.
constexpr uint8_t kSecondaryCompressor = 0x01;
constexpr uint8_t kCodeTable = 0x02;
constexpr uint8_t kApplicationData = 0x04;

// Window indicator bits.
constexpr uint8_t kSourceSegment = 0x01;
constexpr uint8_t kTargetSegment = 0x02;
constexpr uint8_t kWindowChecksum = 0x04;

std::string Number(uint64_t value) { return std::to_string(value); }

[[noreturn]] void Reject(const std::string& text) { throw Exception("VcdiffDecoder->DecodeWindow: " + text); }

// The real position of a stream: FileStream::GetPosition reports only the
// last Seek, so ask the stream where it stands.
int64_t Tell(FileStream* stream) { return stream->Seek(0, 1); }

}  // namespace

struct VcdiffDecoder::Window {
    bool hasChecksum = false;
    uint32_t expectedChecksum = 0;
    FileStream* segmentStream = nullptr;
    uint32_t segmentPosition = 0;
    uint32_t segmentLength = 0;
    int64_t targetResume = 0;  // where the target continues after a target segment
    uint32_t targetLength = 0;
    uint32_t dataLength = 0;
    uint32_t instructionsLength = 0;
    uint32_t addressesLength = 0;

    const uint8_t* segment = nullptr;
    uint8_t* output = nullptr;
    uint32_t position = 0;  // bytes of the target window produced so far
    const uint8_t* data = nullptr;
    uint32_t dataPosition = 0;
    uint8_t* instructions = nullptr;
};

uint8_t* VcdiffDecoder::Buffer::Reserve(uint32_t size) {
    // Never null, not even for an empty section, so that pointer sums and
    // copies of zero bytes stay well defined.
    if (size > capacity || !bytes) {
        bytes.reset();
        capacity = 0;
        try {
            bytes.reset(new uint8_t[std::max<uint32_t>(size, 1)]);
        } catch (const std::bad_alloc&) {
            throw Exception("VcdiffDecoder: Not enough memory for a buffer of " + Number(size) + " bytes.");
        }
        capacity = size;
    }
    return bytes.get();
}

VcdiffDecoder::VcdiffDecoder(FileStream* sourceStream, FileStream* deltaStream, FileStream* targetStream)
    : source(sourceStream), delta(deltaStream), target(targetStream), codeTable(&CodeTable::Default()) {}

VcdiffDecoder::~VcdiffDecoder() = default;

void VcdiffDecoder::Decode(FileStream* source, FileStream* delta, FileStream* target, const CancellationToken* cancel) {
    if (source == nullptr || delta == nullptr || target == nullptr) return;
    VcdiffDecoder decoder(source, delta, target);
    decoder.ReadHeader();
    do {
        if (IsCancelled(cancel)) throw Exception("", ErrorCode::UserCancelled);
    } while (decoder.DecodeWindow());
}

uint64_t VcdiffDecoder::MemoryNeed(FileStream* source, FileStream* delta) {
    MemoryStream noTarget;
    VcdiffDecoder scan(source, delta, &noTarget);
    uint64_t most[5] = {};
    try {
        scan.ReadHeader();
        for (int32_t indicator; (indicator = delta->ReadByte()) >= 0;) {
            Window window;
            scan.ReadWindowHeader(static_cast<uint8_t>(indicator), window);
            const uint32_t sizes[5] = {window.segmentLength, window.targetLength, window.dataLength,
                                       window.instructionsLength, window.addressesLength};
            for (int kind = 0; kind < 5; ++kind) most[kind] = std::max<uint64_t>(most[kind], sizes[kind]);
            delta->Seek(int64_t{window.dataLength} + window.instructionsLength + window.addressesLength, 1);
        }
    } catch (const Exception&) {
        most[1] = kMaxTargetWindowLength;
    }
    delta->Seek(0, 0);
    return most[0] + most[1] + most[2] + most[3] + most[4];
}

void VcdiffDecoder::ReadHeader() {
    uint8_t magic[4];
    CheckedReadBytes(delta, magic, 4);
    if (std::memcmp(magic, kMagic, 3) != 0) {
        throw Exception("VcdiffDecoder->ReadHeader: Invalid VCDIFF header in delta stream");
    }
    if (magic[3] != 0) {
        throw Exception("VcdiffDecoder->ReadHeader: VcdiffDecoder can only read delta streams of version 0");
    }
    const uint8_t indicator = CheckedReadByte(delta);
    if (indicator & kSecondaryCompressor) {
        throw Exception(
            "VcdiffDecoder->ReadHeader: VcdiffDecoder does not handle delta stream using secondary compressors");
    }
    if (indicator & 0xF8)
        throw Exception("VcdiffDecoder->ReadHeader: Invalid header indicator - bits 3-7 not all zero.");
    if (indicator & kCodeTable) ReadCodeTable();
    if (indicator & kApplicationData) SkipDeltaBytes(ReadBigEndian7BitEncodedInt(delta));
}

void VcdiffDecoder::ReadCodeTable() {
    if (!codeTableAllowed) {
        throw Exception("VcdiffDecoder->ReadCodeTable: A compressed code table may not bring a code table of its own.");
    }
    const uint32_t length = ReadBigEndian7BitEncodedInt(delta);
    if (length < 2) {
        throw Exception("VcdiffDecoder->ReadCodeTable: Code table length " + Number(length) +
                        " leaves no room for the cache sizes.");
    }
    const uint8_t nearSize = CheckedReadByte(delta);
    const uint8_t sameSize = CheckedReadByte(delta);
    const uint32_t compressedLength = length - 2;
    RequireDeltaBytes(compressedLength, "Compressed code table");
    Buffer compressed;
    uint8_t* compressedBytes = compressed.Reserve(compressedLength);
    CheckedReadBytes(delta, compressedBytes, static_cast<int32_t>(compressedLength));

    // The table is sent as a delta against the default table's own bytes.
    CodeTable::Encoded defaultBytes = CodeTable::Default().Encode();
    CodeTable::Encoded decoded{};
    MemoryStream tableSource;
    MemoryStream tableDelta;
    MemoryStream tableTarget;
    tableSource.Attach(defaultBytes.data(), CodeTable::kEncodedSize);
    tableDelta.Attach(compressedBytes, static_cast<int32_t>(compressedLength));
    tableTarget.Attach(decoded.data(), CodeTable::kEncodedSize);
    VcdiffDecoder tableDecoder(&tableSource, &tableDelta, &tableTarget);
    tableDecoder.codeTableAllowed = false;
    tableDecoder.ReadHeader();
    while (tableDecoder.DecodeWindow()) {
    }
    if (tableTarget.GetPosition() != CodeTable::kEncodedSize) {
        throw Exception("VcdiffDecoder->ReadCodeTable: Compressed code table was incorrect size");
    }
    ownCodeTable = std::make_unique<CodeTable>(decoded);
    codeTable = ownCodeTable.get();
    if (addressCache) {
        addressCache->Resize(nearSize, sameSize);
    } else {
        addressCache = std::make_unique<AddressCache>(nearSize, sameSize);
    }
}

bool VcdiffDecoder::DecodeWindow() {
    const int32_t indicator = delta->ReadByte();
    if (indicator < 0) return false;
    Window window;
    ReadWindowHeader(static_cast<uint8_t>(indicator), window);
    ReadSegment(window);
    ReadSections(window);
    RunInstructions(window);
    FinishWindow(window);
    return true;
}

void VcdiffDecoder::ReadWindowHeader(uint8_t indicator, Window& window) {
    window.hasChecksum = (indicator & kWindowChecksum) != 0;
    if ((indicator & (kSourceSegment | kTargetSegment)) == (kSourceSegment | kTargetSegment)) {
        throw Exception("Invalid window indicator - bits 0 and 1 both set.");
    }
    if (indicator & 0xF8) throw Exception("Invalid window indicator - bits 3-7 not all zero.");
    if ((indicator & kSourceSegment) && source == nullptr) {
        throw Exception("Source stream requested by delta but not provided by caller.");
    }
    if (indicator & (kSourceSegment | kTargetSegment)) {
        window.segmentLength = ReadBigEndian7BitEncodedInt(delta);
        // Unsigned: sources of 2 GiB and more have positions above the
        // signed range.
        window.segmentPosition = ReadBigEndian7BitEncodedInt(delta);
        if (window.segmentLength > kMaxSegmentLength) {
            Reject("Segment length " + Number(window.segmentLength) + " exceeds the limit of " +
                   Number(kMaxSegmentLength) + " bytes.");
        }
        const uint64_t segmentEnd = uint64_t{window.segmentPosition} + window.segmentLength;
        if (indicator & kSourceSegment) {
            window.segmentStream = source;
            const int64_t sourceLength = source->GetLength();
            if (segmentEnd > static_cast<uint64_t>(sourceLength)) {
                Reject("Source segment of " + Number(window.segmentLength) + " bytes at " +
                       Number(window.segmentPosition) + " runs past the end of the source (" + Number(sourceLength) +
                       " bytes).");
            }
        } else {
            window.segmentStream = target;
            window.targetResume = Tell(target);
            if (segmentEnd > static_cast<uint64_t>(window.targetResume)) {
                Reject("Target segment of " + Number(window.segmentLength) + " bytes at " +
                       Number(window.segmentPosition) + " runs past the " + Number(window.targetResume) +
                       " bytes written so far.");
            }
        }
    }

    const uint32_t encodingLength = ReadBigEndian7BitEncodedInt(delta);
    const int64_t encodingStart = Tell(delta);
    if (encodingLength > kMaxDeltaEncodingLength) {
        Reject("Delta encoding length " + Number(encodingLength) + " exceeds the limit of " +
               Number(kMaxDeltaEncodingLength) + " bytes.");
    }
    RequireDeltaBytes(encodingLength, "Delta encoding");
    window.targetLength = ReadBigEndian7BitEncodedInt(delta);
    if (window.targetLength > kMaxTargetWindowLength) {
        Reject("Target window length " + Number(window.targetLength) + " exceeds the limit of " +
               Number(kMaxTargetWindowLength) + " bytes.");
    }
    if (CheckedReadByte(delta) != 0) throw Exception("VcdiffDecoder is unable to handle compressed delta sections.");
    window.dataLength = ReadBigEndian7BitEncodedInt(delta);
    window.instructionsLength = ReadBigEndian7BitEncodedInt(delta);
    window.addressesLength = ReadBigEndian7BitEncodedInt(delta);
    if (window.hasChecksum) {
        uint8_t bytes[4];
        CheckedReadBytes(delta, bytes, 4);
        window.expectedChecksum =
            uint32_t{bytes[0]} << 24 | uint32_t{bytes[1]} << 16 | uint32_t{bytes[2]} << 8 | bytes[3];
    }
    const uint64_t counted = static_cast<uint64_t>(Tell(delta) - encodingStart) + window.dataLength +
                             window.instructionsLength + window.addressesLength;
    if (counted != encodingLength) {
        Reject("Section lengths add up to " + Number(counted) + " bytes, but the delta encoding length is " +
               Number(encodingLength) + ".");
    }
}

void VcdiffDecoder::ReadSegment(Window& window) {
    if (window.segmentStream == nullptr) return;
    uint8_t* segment = segmentBuffer.Reserve(window.segmentLength);
    window.segmentStream->Seek(window.segmentPosition, 0);
    CheckedReadBytes(window.segmentStream, segment, static_cast<int32_t>(window.segmentLength));
    if (window.segmentStream == target) target->Seek(window.targetResume, 0);
    window.segment = segment;
}

void VcdiffDecoder::ReadSections(Window& window) {
    // Lengths were checked against the delta encoding, which was checked
    // against the bytes left in the delta.
    uint8_t* data = dataBuffer.Reserve(window.dataLength);
    CheckedReadBytes(delta, data, static_cast<int32_t>(window.dataLength));
    window.data = data;
    window.instructions = instructionsBuffer.Reserve(window.instructionsLength);
    CheckedReadBytes(delta, window.instructions, static_cast<int32_t>(window.instructionsLength));
    uint8_t* addresses = addressesBuffer.Reserve(window.addressesLength);
    CheckedReadBytes(delta, addresses, static_cast<int32_t>(window.addressesLength));
    if (!addressCache) {
        addressCache = std::make_unique<AddressCache>(AddressCache::kDefaultNearSize, AddressCache::kDefaultSameSize);
    }
    addressCache->Reset(addresses, static_cast<int32_t>(window.addressesLength));
    window.output = windowBuffer.Reserve(window.targetLength);
}

void VcdiffDecoder::RunInstructions(Window& window) {
    MemoryStream instructions;
    instructions.Attach(window.instructions, static_cast<int32_t>(window.instructionsLength));
    for (int32_t index = instructions.ReadByte(); index >= 0; index = instructions.ReadByte()) {
        const CodeTableEntry& entry = (*codeTable)[static_cast<uint8_t>(index)];
        Execute(entry.first, instructions, window);
        Execute(entry.second, instructions, window);
    }
}

void VcdiffDecoder::Execute(const Instruction& instruction, MemoryStream& instructions, Window& window) {
    if (instruction.type == kNoop) return;
    const uint32_t size = instruction.size != 0 ? instruction.size : ReadBigEndian7BitEncodedInt(&instructions);
    if (instruction.type > kCopy) throw Exception("Invalid instruction type found.");
    const uint32_t room = window.targetLength - window.position;
    if (size > room) {
        Reject("Instruction size " + Number(size) + " overflows the target window (" + Number(room) + " bytes left).");
    }
    uint8_t* out = window.output + window.position;
    switch (instruction.type) {
        case kAdd:
            if (size > window.dataLength - window.dataPosition) {
                Reject("ADD of " + Number(size) + " bytes runs past the end of the data section.");
            }
            std::memcpy(out, window.data + window.dataPosition, size);
            window.dataPosition += size;
            break;
        case kRun:
            if (window.dataPosition >= window.dataLength) Reject("RUN runs past the end of the data section.");
            std::memset(out, window.data[window.dataPosition++], size);
            break;
        default: {
            const uint32_t here = window.segmentLength + window.position;
            const uint32_t address = addressCache->DecodeAddress(instruction.mode, here);
            if (address < window.segmentLength) {
                CopyFromSegment(window, address, size);
            } else {
                CopyWithinWindow(window, address - window.segmentLength, size);
            }
            break;
        }
    }
    window.position += size;
}

void VcdiffDecoder::CopyFromSegment(Window& window, uint32_t address, uint32_t size) {
    // A copy may not run from the segment on into the target window.
    if (size > window.segmentLength - address) {
        Reject("COPY of " + Number(size) + " bytes at " + Number(address) + " runs past the end of the segment (" +
               Number(window.segmentLength) + " bytes).");
    }
    std::memcpy(window.output + window.position, window.segment + address, size);
}

void VcdiffDecoder::CopyWithinWindow(Window& window, uint32_t offset, uint32_t size) {
    // offset lies before the position (the address cache made sure). When
    // the copy overlaps what it produces, the bytes from offset on repeat
    // with this period; each pass copies every whole period ready so far,
    // so the copied run doubles and source and destination never overlap.
    uint8_t* out = window.output + window.position;
    const uint8_t* from = window.output + offset;
    const uint32_t period = window.position - offset;
    uint32_t done = 0;
    while (done < size) {
        const uint32_t ready = period + done;
        const uint32_t n = std::min(size - done, ready);
        std::memcpy(out + done, from, n);
        done += n;
    }
}

void VcdiffDecoder::FinishWindow(Window& window) {
    if (window.position != window.targetLength) {
        Reject("Instructions produced " + Number(window.position) + " of the " + Number(window.targetLength) +
               " bytes of the target window.");
    }
    if (window.dataPosition != window.dataLength) {
        Reject(Number(window.dataLength - window.dataPosition) + " bytes of the data section were not used.");
    }
    if (addressCache->Remaining() != 0) {
        Reject(Number(addressCache->Remaining()) + " bytes of the addresses section were not used.");
    }
    // An empty window writes nothing: a memory stream refuses writes of
    // zero bytes.
    if (window.targetLength > 0) {
        const uint32_t written = target->Write(window.output, window.targetLength);
        if (written != window.targetLength) {
            Reject("The target took only " + Number(written) + " of the " + Number(window.targetLength) +
                   " bytes of the window.");
        }
    }
    if (window.hasChecksum) {
        const uint32_t actual = Checksum(window.output, window.targetLength);
        if (actual != window.expectedChecksum) throw Exception("Invalid Checksum after decoding window");
    }
}

void VcdiffDecoder::SkipDeltaBytes(uint32_t count) {
    // Read in small pieces: the count comes from the delta and must not
    // decide how much memory is taken.
    uint8_t scratch[4096];
    while (count > 0) {
        const uint32_t n = std::min<uint32_t>(count, sizeof scratch);
        CheckedReadBytes(delta, scratch, static_cast<int32_t>(n));
        count -= n;
    }
}

void VcdiffDecoder::RequireDeltaBytes(uint32_t count, const char* what) {
    const int64_t left = delta->GetLength() - Tell(delta);
    if (static_cast<int64_t>(count) > left) {
        throw Exception(std::string("VcdiffDecoder: ") + what + " of " + Number(count) + " bytes is longer than the " +
                        Number(left < 0 ? 0 : left) + " bytes left in the delta.");
    }
}
