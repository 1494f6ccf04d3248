#include "tools/publisher/lzma_encoder.h"

#include <LzmaEnc.h>

#include <algorithm>
#include <cstdlib>
#include <exception>

#include "base/exception.h"
#include "base/memory_stream.h"

namespace {

void* Allocate(void*, size_t size) { return size == 0 ? nullptr : std::malloc(size); }
void Release(void*, void* address) { std::free(address); }
ISzAlloc allocator = {Allocate, Release};

// The SDK calls back through C; exceptions must not cross it, so they are
// parked here and thrown again once the encoder has returned.
struct Input {
    ISeqInStream stream;
    FileStream* source;
    uint64_t left;
    std::exception_ptr error;
};

struct Output {
    ISeqOutStream stream;
    const ByteSink* sink;
    std::exception_ptr error;
};

SRes ReadInput(void* self, void* buffer, size_t* size) {
    Input* input = static_cast<Input*>(self);
    const size_t wanted = static_cast<size_t>(std::min<uint64_t>(std::min<uint64_t>(*size, input->left), 1u << 30));
    *size = 0;
    if (wanted == 0) return SZ_OK;
    try {
        const uint32_t n = input->source->Read(buffer, static_cast<uint32_t>(wanted));
        if (n == 0) throw Exception("The source ended before its announced size.");
        input->left -= n;
        *size = n;
        return SZ_OK;
    } catch (...) {
        input->error = std::current_exception();
        return SZ_ERROR_READ;
    }
}

size_t WriteOutput(void* self, const void* data, size_t size) {
    Output* output = static_cast<Output*>(self);
    try {
        (*output->sink)(static_cast<const uint8_t*>(data), size);
        return size;
    } catch (...) {
        output->error = std::current_exception();
        return 0;
    }
}

class Encoder {
public:
    Encoder() : handle(LzmaEnc_Create(&allocator)) {
        if (handle == nullptr) throw Exception("Failed to create the LZMA encoder.");
    }
    Encoder(const Encoder&) = delete;
    Encoder& operator=(const Encoder&) = delete;
    ~Encoder() { LzmaEnc_Destroy(handle, &allocator, &allocator); }
    CLzmaEncHandle get() const { return handle; }

private:
    CLzmaEncHandle handle;
};

}  // namespace

void EncodeLzma(FileStream& source, uint64_t size, const LzmaOptions& options, const ByteSink& sink) {
    CLzmaEncProps props;
    LzmaEncProps_Init(&props);
    props.level = options.level;
    props.dictSize = options.dictionarySize;
    props.reduceSize = size < 0xFFFFFFFFu ? static_cast<UInt32>(size) : 0xFFFFFFFFu;
    props.lc = options.lc;
    props.lp = options.lp;
    props.pb = options.pb;
    props.writeEndMark = (options.endMarker || !options.storeSize) ? 1 : 0;
    props.numThreads = 1;

    Encoder encoder;
    if (LzmaEnc_SetProps(encoder.get(), &props) != SZ_OK) throw Exception("Unsupported LZMA encoder settings.");
    Byte header[LZMA_PROPS_SIZE + 8];
    SizeT propsSize = LZMA_PROPS_SIZE;
    if (LzmaEnc_WriteProperties(encoder.get(), header, &propsSize) != SZ_OK) {
        throw Exception("Failed to write LZMA properties.");
    }
    for (int i = 0; i < 8; ++i) {
        header[LZMA_PROPS_SIZE + i] = options.storeSize ? static_cast<Byte>(size >> (8 * i)) : 0xFF;
    }
    sink(header, sizeof(header));

    Input input{{ReadInput}, &source, size, nullptr};
    Output output{{WriteOutput}, &sink, nullptr};
    const SRes result = LzmaEnc_Encode(encoder.get(), &output.stream, &input.stream, nullptr, &allocator, &allocator);
    if (input.error) std::rethrow_exception(input.error);
    if (output.error) std::rethrow_exception(output.error);
    if (result != SZ_OK) throw Exception("LZMA encoding failed with code " + std::to_string(result) + ".");
    if (input.left != 0) throw Exception("The source ended before its announced size.");
}

std::string EncodeLzma(const std::string& data, const LzmaOptions& options) {
    std::string bytes = data;
    MemoryStream source;
    source.Attach(reinterpret_cast<uint8_t*>(&bytes[0]), static_cast<int32_t>(bytes.size()));
    std::string result;
    EncodeLzma(source, bytes.size(), options, [&](const uint8_t* chunk, size_t length) {
        result.append(reinterpret_cast<const char*>(chunk), length);
    });
    return result;
}
