#include "net/signature_formats.h"

#include <algorithm>
#include <cstring>

namespace {

const char kBase64Digits[] = "ABCDEFGHIJKLMNOPQRSTUVWXYZabcdefghijklmnopqrstuvwxyz0123456789+/";

// SubjectPublicKeyInfo up to the point: SEQUENCE { SEQUENCE { id-ecPublicKey,
// prime256v1 }, BIT STRING (no unused bits) }.
const uint8_t kPublicKeyFrame[] = {0x30, 0x59, 0x30, 0x13, 0x06, 0x07, 0x2a, 0x86, 0x48, 0xce, 0x3d, 0x02, 0x01,
                                   0x06, 0x08, 0x2a, 0x86, 0x48, 0xce, 0x3d, 0x03, 0x01, 0x07, 0x03, 0x42, 0x00};

// The order n of P-256's base point; r and s lie in [1, n - 1].
const uint8_t kCurveOrder[32] = {0xff, 0xff, 0xff, 0xff, 0x00, 0x00, 0x00, 0x00, 0xff, 0xff, 0xff,
                                 0xff, 0xff, 0xff, 0xff, 0xff, 0xbc, 0xe6, 0xfa, 0xad, 0xa7, 0x17,
                                 0x9e, 0x84, 0xf3, 0xb9, 0xca, 0xc2, 0xfc, 0x63, 0x25, 0x51};

int Base64Value(char c) {
    const char* found = c == '\0' ? nullptr : std::strchr(kBase64Digits, c);
    return found == nullptr ? -1 : static_cast<int>(found - kBase64Digits);
}

}  // namespace

bool DecodeBase64(const std::string& text, std::string& bytes) {
    std::string digits;
    for (const char c : text) {
        if (c == ' ' || c == '\t' || c == '\r' || c == '\n') continue;
        digits += c;
    }
    if (digits.size() % 4 != 0) return false;
    size_t padding = 0;
    while (padding < 2 && padding < digits.size() && digits[digits.size() - 1 - padding] == '=') ++padding;
    bytes.clear();
    uint32_t group = 0;
    for (size_t i = 0; i < digits.size() - padding; ++i) {
        const int value = Base64Value(digits[i]);
        if (value < 0) return false;
        group = (group << 6) | static_cast<uint32_t>(value);
        if (i % 4 == 3) {
            bytes += static_cast<char>(group >> 16);
            bytes += static_cast<char>(group >> 8);
            bytes += static_cast<char>(group);
            group = 0;
        }
    }
    // The last group: two digits give one byte, three give two; the bits
    // past them must be zero, so each text has one decoding.
    if (padding == 2) {
        if ((group & 0x0F) != 0) return false;
        bytes += static_cast<char>(group >> 4);
    } else if (padding == 1) {
        if ((group & 0x03) != 0) return false;
        bytes += static_cast<char>(group >> 10);
        bytes += static_cast<char>(group >> 2);
    }
    return true;
}

std::string EncodeBase64(const std::string& bytes) {
    std::string text;
    for (size_t i = 0; i < bytes.size(); i += 3) {
        const size_t count = std::min<size_t>(3, bytes.size() - i);
        uint32_t group = 0;
        for (size_t k = 0; k < 3; ++k) {
            group = (group << 8) | (k < count ? static_cast<uint8_t>(bytes[i + k]) : 0u);
        }
        for (size_t k = 0; k < 4; ++k) {
            text += k <= count ? kBase64Digits[(group >> (18 - 6 * k)) & 0x3F] : '=';
        }
    }
    return text;
}

namespace {

// One DER INTEGER at der[at]: a positive number of at most 32 bytes in its
// shortest form, copied right-aligned into value.
bool ReadInteger(const std::string& der, size_t& at, uint8_t (&value)[32]) {
    if (der.size() - at < 2 || static_cast<uint8_t>(der[at]) != 0x02) return false;
    size_t length = static_cast<uint8_t>(der[at + 1]);
    at += 2;
    if (length == 0 || length > 33 || der.size() - at < length) return false;
    const uint8_t* digits = reinterpret_cast<const uint8_t*>(der.data() + at);
    at += length;
    if (digits[0] & 0x80) return false;  // negative
    if (digits[0] == 0 && length > 1) {
        // DER allows a leading zero only to keep the next byte's high bit
        // from reading as a sign.
        if ((digits[1] & 0x80) == 0) return false;
        ++digits;
        --length;
    }
    if (length > 32) return false;
    std::memset(value, 0, sizeof value);
    std::memcpy(value + 32 - length, digits, length);
    return true;
}

bool InSignatureRange(const uint8_t (&value)[32]) {
    const bool zero = std::all_of(value, value + 32, [](uint8_t byte) { return byte == 0; });
    return !zero && std::memcmp(value, kCurveOrder, 32) < 0;
}

std::string IntegerDer(const uint8_t* value) {
    size_t skip = 0;
    while (skip < 31 && value[skip] == 0) ++skip;
    std::string digits(reinterpret_cast<const char*>(value + skip), 32 - skip);
    if (static_cast<uint8_t>(digits[0]) & 0x80) digits.insert(digits.begin(), '\0');
    return std::string{'\x02', static_cast<char>(digits.size())} + digits;
}

}  // namespace

bool DecodePem(const std::string& text, const std::string& label, std::string& der) {
    if (text.size() > kMaximumPemSize) return false;
    const std::string begin = "-----BEGIN " + label + "-----";
    const std::string end = "-----END " + label + "-----";
    const size_t start = text.find(begin);
    if (start == std::string::npos) return false;
    const size_t body = start + begin.size();
    const size_t stop = text.find(end, body);
    if (stop == std::string::npos) return false;
    return DecodeBase64(text.substr(body, stop - body), der);
}

std::string EncodePem(const std::string& label, const std::string& der) {
    const std::string digits = EncodeBase64(der);
    std::string text = "-----BEGIN " + label + "-----\n";
    for (size_t i = 0; i < digits.size(); i += 64) text += digits.substr(i, 64) + "\n";
    return text + "-----END " + label + "-----\n";
}

bool ParsePublicKeysPem(const std::string& text, std::vector<P256PublicKey>& keys) {
    keys.clear();
    if (text.size() > kMaximumPemSize) return false;
    const std::string end = "-----END PUBLIC KEY-----";
    for (size_t at = 0; text.find("-----BEGIN PUBLIC KEY-----", at) != std::string::npos;) {
        const size_t stop = text.find(end, at);
        P256PublicKey key{};
        if (stop == std::string::npos || !ParsePublicKeyPem(text.substr(at, stop + end.size() - at), key)) return false;
        keys.push_back(key);
        at = stop + end.size();
    }
    return !keys.empty();
}

bool ParsePublicKeyPem(const std::string& text, P256PublicKey& key) {
    std::string der;
    if (!DecodePem(text, "PUBLIC KEY", der)) return false;
    const size_t frame = sizeof kPublicKeyFrame;
    if (der.size() != frame + key.size() || std::memcmp(der.data(), kPublicKeyFrame, frame) != 0) return false;
    if (static_cast<uint8_t>(der[frame]) != 0x04) return false;  // a compressed point
    std::memcpy(key.data(), der.data() + frame, key.size());
    return true;
}

std::string PublicKeyDer(const P256PublicKey& key) {
    return std::string(reinterpret_cast<const char*>(kPublicKeyFrame), sizeof kPublicKeyFrame) +
           std::string(reinterpret_cast<const char*>(key.data()), key.size());
}

std::string PublicKeyPem(const P256PublicKey& key) { return EncodePem("PUBLIC KEY", PublicKeyDer(key)); }

bool ParseSignatureDer(const std::string& der, P256Signature& signature) {
    // Two integers of at most 33 bytes keep the sequence's length below
    // 128, so it has the one-byte form.
    if (der.size() < 2 || static_cast<uint8_t>(der[0]) != 0x30) return false;
    if (static_cast<size_t>(static_cast<uint8_t>(der[1])) != der.size() - 2) return false;
    size_t at = 2;
    uint8_t r[32];
    uint8_t s[32];
    if (!ReadInteger(der, at, r) || !ReadInteger(der, at, s) || at != der.size()) return false;
    if (!InSignatureRange(r) || !InSignatureRange(s)) return false;
    std::memcpy(signature.data(), r, 32);
    std::memcpy(signature.data() + 32, s, 32);
    return true;
}

std::string SignatureDer(const P256Signature& signature) {
    const std::string body = IntegerDer(signature.data()) + IntegerDer(signature.data() + 32);
    return std::string{'\x30', static_cast<char>(body.size())} + body;
}
