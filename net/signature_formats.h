#pragma once

#include <array>
#include <cstdint>
#include <string>
#include <vector>

// The publisher's ECDSA P-256 keys and signatures in the forms OpenSSL and
// other tools exchange them: PEM text around DER bytes. Only this one curve
// in exactly the encodings OpenSSL writes is accepted, so no reader ever
// has to interpret ASN.1 beyond comparing a fixed frame.

// The public point, uncompressed: 0x04, then X and Y, 32 bytes each,
// big-endian.
using P256PublicKey = std::array<uint8_t, 65>;
// r, then s, 32 bytes each, big-endian (the form CNG signs and verifies).
using P256Signature = std::array<uint8_t, 64>;

// PEM text is a few lines; a longer one is refused unread.
constexpr size_t kMaximumPemSize = 16 * 1024;

// The bytes between "-----BEGIN label-----" and "-----END label-----"
// (text around them is ignored, as OpenSSL does), decoded from Base64 with
// line breaks and blanks allowed between the digits. False when the frame
// is missing or the Base64 is malformed.
bool DecodePem(const std::string& text, const std::string& label, std::string& der);
// Base64 in lines of 64 between the two frame lines, each line ended by LF.
std::string EncodePem(const std::string& label, const std::string& der);
// Base64 with padding; decoding allows blanks and line breaks between the
// digits and refuses bits beyond the last byte, so each text has one
// decoding.
std::string EncodeBase64(const std::string& bytes);
bool DecodeBase64(const std::string& text, std::string& bytes);

// A SubjectPublicKeyInfo of an EC key on P-256 with an uncompressed point,
// in PEM ("PUBLIC KEY"), as `openssl pkey -pubout` writes it.
bool ParsePublicKeyPem(const std::string& text, P256PublicKey& key);
// Every "PUBLIC KEY" block of text in turn (a program may trust several
// keys while one replaces another); false when there is none or one of
// them is not such a key.
bool ParsePublicKeysPem(const std::string& text, std::vector<P256PublicKey>& keys);
std::string PublicKeyDer(const P256PublicKey& key);
std::string PublicKeyPem(const P256PublicKey& key);

// An ECDSA-Sig-Value (a SEQUENCE of the INTEGERs r and s) in DER, as
// `openssl dgst -sha256 -sign` writes it. Parsing is strict: minimal
// lengths, no sign or padding bytes beyond DER's one, nothing after the
// end, and r and s each between 1 and the curve's order minus 1.
bool ParseSignatureDer(const std::string& der, P256Signature& signature);
std::string SignatureDer(const P256Signature& signature);
