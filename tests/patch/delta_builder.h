#pragma once

#include <cstdint>
#include <string>

// Hand-made deltas for what xdelta3 never writes (own code tables, target
// segments) and for every kind of damage.

std::string Varint(uint32_t value);
// Magic, version 0 and the header indicator.
std::string Header(uint8_t indicator = 0);

// Instructions of the default code table, each with its size written out.
std::string AddOp(uint32_t size);
std::string RunOp(uint32_t size);
std::string CopyOp(uint32_t size, uint8_t mode);

struct WindowLayout {
    uint8_t indicator = 0;
    uint32_t segmentLength = 0;
    uint32_t segmentPosition = 0;
    uint32_t targetLength = 0;
    uint8_t deltaIndicator = 0;
    std::string data;
    std::string instructions;
    std::string addresses;
    uint32_t checksum = 0;            // written when the indicator has bit 2
    int32_t encodingLengthError = 0;  // added to the true delta encoding length
};
std::string Window(const WindowLayout& layout);

// The header bytes that bring an application-defined code table (its six
// rows), sent as a delta against the default table.
std::string CodeTableSection(const std::string& table, uint8_t nearSize, uint8_t sameSize);

struct DecodeResult {
    std::string target;  // what reached the target stream
    std::string error;   // the Exception's text; empty on success
    int32_t code = -1;
};
// Decodes with memory streams; the target has room for capacity bytes.
DecodeResult DecodeInMemory(const std::string& source, const std::string& delta, size_t capacity = 1 << 16);
