#pragma once

#include <string>

#include "net/sha256.h"
#include "net/signature_formats.h"

// A signature file holds one DER signature (at most 72 bytes); anything
// much larger is refused unread.
constexpr int64_t kMaximumSignatureFileSize = 1024;

// A signed file is a description: a file larger than the largest
// description is refused unread.
constexpr int64_t kMaximumSignedFileSize = 16 * 1024 * 1024;

// Throws Exception with CorruptData unless signatureDer is a valid ECDSA
// P-256 signature, by one of the keys in publicKeysPem (PEM public keys one
// after the other: while a key is being replaced the program trusts both),
// over the SHA-256 of data (called name in the messages). The messages say
// which part failed: the keys, the signature, or the match.
void CheckSignature(const std::string& data, const std::string& signatureDer, const std::string& publicKeysPem,
                    const std::string& name);
// CheckSignature on the bytes of the files at path and signaturePath.
void CheckFileSignature(const std::string& path, const std::string& signaturePath, const std::string& publicKeysPem);

// The platform's ECDSA verification (CNG on Windows, OpenSSL elsewhere) of
// signature over digest; false also when the key is not a point of the
// curve.
bool VerifyP256Signature(const P256PublicKey& key, const Sha256Digest& digest, const P256Signature& signature);
