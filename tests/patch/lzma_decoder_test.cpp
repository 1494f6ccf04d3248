// DecodeLzma on streams made by the SDK encoder in every shape the
// stand-alone header allows, and on broken or hostile streams.
#include <gtest/gtest.h>

#include <string>

#include "base/exception.h"
#include "base/memory_stream.h"
#include "patch/lzma_decoder.h"
#include "tests/support/format_test_helpers.h"
#include "tools/publisher/lzma_encoder.h"

namespace {

const char kDataError[] = "Data error, please verify that downloaded files are complete and correct!";
const char kMissingData[] = "Missing data, please verify that downloaded files are complete!";
const char kAllocationFailure[] = "Failed to allocate LZMA structures while decoding.";

// Text that compresses but not to nothing, so the decoder works through
// literals as well as matches.
std::string SampleData(size_t size) {
    std::string data;
    data.reserve(size);
    uint32_t state = 12345;
    while (data.size() < size) {
        state = state * 1103515245u + 12345u;
        if ((state >> 16) % 4 == 0) {
            data += static_cast<char>(state >> 24);
        } else {
            data += "word" + std::to_string((state >> 8) % 97) + ' ';
        }
    }
    data.resize(size);
    return data;
}

std::string ErrorOf(const std::string& lzma) {
    try {
        DecodeToString(lzma);
    } catch (const Exception& error) {
        return error.message;
    }
    return "no error";
}

void SetDictionary(std::string& lzma, uint32_t size) {
    for (int i = 0; i < 4; ++i) lzma[1 + i] = static_cast<char>(size >> (8 * i));
}

void SetUnknownSize(std::string& lzma) {
    for (int i = 5; i < 13; ++i) lzma[i] = static_cast<char>(0xFF);
}

struct Shape {
    const char* name;
    size_t size;
    LzmaOptions options;
};

LzmaOptions Options(bool storeSize, bool endMarker, int lc = 3, int lp = 0, int pb = 2, uint32_t dictionary = 0) {
    LzmaOptions options;
    options.storeSize = storeSize;
    options.endMarker = endMarker;
    options.lc = lc;
    options.lp = lp;
    options.pb = pb;
    options.dictionarySize = dictionary;
    return options;
}

TEST(DecodeLzma, DecodesEveryHeaderShapeAndSizeAroundTheBufferSize) {
    const Shape shapes[] = {
        {"empty, size stored", 0, Options(true, false)},
        {"empty, end marker", 0, Options(false, true)},
        {"one byte", 1, Options(true, false)},
        {"one buffer less one", 65535, Options(true, false)},
        {"exactly one buffer", 65536, Options(true, false)},
        {"exactly one buffer, end marker", 65536, Options(false, true)},
        {"one buffer and one", 65537, Options(true, false)},
        {"size and end marker", 200000, Options(true, true)},
        {"end marker only", 200000, Options(false, true)},
        {"lc0 lp2 pb0", 150000, Options(true, false, 0, 2, 0)},
        {"lc8 lp4 pb4", 150000, Options(false, true, 8, 4, 4)},
        {"data far larger than the dictionary", 300000, Options(true, false, 3, 0, 2, 4096)},
    };
    for (const Shape& shape : shapes) {
        SCOPED_TRACE(shape.name);
        const std::string data = SampleData(shape.size);
        EXPECT_EQ(DecodeToString(EncodeLzma(data, shape.options)), data);
    }
}

TEST(DecodeLzma, ReportsBrokenStreamsWithTheTableTexts) {
    const std::string data = SampleData(100000);
    const std::string sized = EncodeLzma(data, Options(true, false));
    const std::string marked = EncodeLzma(data, Options(false, true));

    std::string sizeWithoutMarker = sized;
    SetUnknownSize(sizeWithoutMarker);
    std::string markerBeforeSize = EncodeLzma(data, Options(true, true));
    markerBeforeSize[5] = static_cast<char>(markerBeforeSize[5] + 1);
    std::string badFirstRangeByte = sized;
    badFirstRangeByte[13] = 1;
    std::string badProperties = sized;
    badProperties[0] = static_cast<char>(225);

    struct Case {
        const char* name;
        std::string lzma;
        const char* error;
    } cases[] = {
        {"size unknown and no end marker", sizeWithoutMarker, kDataError},
        {"end marker before the stated size", markerBeforeSize, kDataError},
        {"sized stream cut in half", sized.substr(0, sized.size() / 2), kDataError},
        {"marked stream cut short", marked.substr(0, marked.size() - 8), kDataError},
        {"header only", sized.substr(0, 13), kDataError},
        {"header cut short", sized.substr(0, 12), kMissingData},
        {"nothing at all", "", kMissingData},
        {"range coder must start with zero", badFirstRangeByte, kDataError},
        {"lc/lp/pb byte out of range", badProperties, kAllocationFailure},
    };
    for (const Case& c : cases) {
        SCOPED_TRACE(c.name);
        EXPECT_EQ(ErrorOf(c.lzma), c.error);
    }
}

TEST(DecodeLzma, RefusesHugeDictionariesUnlessTheSizeBoundsThem) {
    const std::string data = SampleData(5000);
    std::string sized = EncodeLzma(data, Options(true, false));
    std::string marked = EncodeLzma(data, Options(false, true));

    // Larger than any tool writes, with nothing to bound it: refused
    // without trying to allocate 4 GiB.
    std::string hostile = marked;
    SetDictionary(hostile, 0xFFFFFFFFu);
    EXPECT_EQ(ErrorOf(hostile), kAllocationFailure);
    SetDictionary(hostile, kMaximumLzmaDictionarySize + 1);
    EXPECT_EQ(ErrorOf(hostile), kAllocationFailure);

    // The same request with a stated size of 5000 bytes needs only that.
    SetDictionary(sized, 0xFFFFFFFFu);
    EXPECT_EQ(DecodeToString(sized), data);
}

TEST(DecodeLzma, StopsQuietlyWhenQuitIsRequested) {
    const std::string data = SampleData(300000);
    quitRequested = true;
    std::string decoded;
    EXPECT_NO_THROW(decoded = DecodeToString(EncodeLzma(data)));
    quitRequested = false;
    EXPECT_LT(decoded.size(), data.size());
}

// A stream failure inside the loop passes on unchanged (and, under the
// leak checker, shows that the decoder state is freed on that path).
class FailingInput : public MemoryStream {
public:
    uint32_t Read(void* destination, uint32_t count) override {
        if (++reads == 3) throw Exception("Failed to read data from file.");
        return MemoryStream::Read(destination, count);
    }
    int reads = 0;
};

TEST(DecodeLzma, PassesStreamErrorsOnAfterFreeingTheDecoder) {
    std::string lzma = EncodeLzma(SampleData(400000), Options(true, false, 3, 0, 2, 4096));
    FailingInput input;
    input.Attach(reinterpret_cast<uint8_t*>(&lzma[0]), static_cast<int32_t>(lzma.size()));
    StringOutput output;
    try {
        DecodeLzma(input, output);
        FAIL() << "no error";
    } catch (const Exception& error) {
        EXPECT_EQ(error.message, "Failed to read data from file.");
    }
    EXPECT_GT(output.data.size(), 0u);
}

}  // namespace
