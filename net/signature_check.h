#pragma once

#include <string>

#include "net/sha256.h"
#include "net/signature_formats.h"

// A signature file holds one DER signature (at most 72 bytes); anything
// much larger is refused unread.
constexpr int64_t kMaximumSignatureFileSize = 1024;

// Throws Exception with CorruptData unless signaturePath holds a valid
// ECDSA P-256 signature, by the key in publicKeyPem, over the SHA-256 of
// the bytes of the file at path. The messages say which part failed: the
// key, the signature file, or the match.
void CheckFileSignature(const std::string& path, const std::string& signaturePath, const std::string& publicKeyPem);

// The platform's ECDSA verification (CNG on Windows, OpenSSL elsewhere) of
// signature over digest; false also when the key is not a point of the
// curve.
bool VerifyP256Signature(const P256PublicKey& key, const Sha256Digest& digest, const P256Signature& signature);
