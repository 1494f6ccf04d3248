#pragma once

#include <array>
#include <cstdint>
#include <string>

#include "net/sha256.h"
#include "net/signature_formats.h"

// The publisher's ECDSA P-256 signing key. Its public half is built into
// the updater (CMake option IRONVALE_PUBLIC_KEY); the private half signs
// every patch description and is never committed anywhere.
struct P256PrivateKey {
    std::array<uint8_t, 32> scalar{};  // big-endian
    P256PublicKey publicKey{};
};

// The signature of a description sits beside it under this name.
extern const char kDescriptionSignatureName[];

// A new key from the platform's generator (CNG on Windows, OpenSSL
// elsewhere). Throws Exception when the platform cannot make one.
P256PrivateKey GenerateSigningKey();
// ECDSA over a SHA-256 digest; throws Exception when the platform fails.
P256Signature SignDigest(const P256PrivateKey& key, const Sha256Digest& digest);

// PKCS#8 ("PRIVATE KEY"), as `openssl genpkey` writes it.
std::string PrivateKeyDer(const P256PrivateKey& key);
std::string PrivateKeyPem(const P256PrivateKey& key);
// PKCS#8 ("PRIVATE KEY") or SEC1 ("EC PRIVATE KEY", as `openssl ecparam
// -genkey` writes it) of a P-256 key that carries its public point.
// Throws Exception for anything else.
P256PrivateKey ParsePrivateKeyPem(const std::string& text);
P256PrivateKey LoadSigningKey(const std::string& path);
// The text of a key file, of at most kMaximumPemSize bytes (the rest is not
// read). Throws Exception when it cannot be read.
std::string ReadPemFile(const std::string& path);

// Writes folder/private.pem (readable by its owner only where the file
// system can say so) and folder/public.pem. Refuses to replace an existing
// private key: one lost is every installed updater unable to take patches.
void WriteKeyPair(const std::string& folder, const P256PrivateKey& key);

// Signs folder/patchinfo.xml into folder/patchinfo.xml.sig (DER, as
// `openssl dgst -sha256 -sign` writes it), checking the signature against
// the key's public half first. Throws Exception on every failure.
void SignPatchDescription(const std::string& folder, const P256PrivateKey& key);

// Creates path with text, failing if it exists; only the owner may read it
// where the platform allows. False on any failure.
[[nodiscard]] bool WritePrivateFile(const std::string& path, const std::string& text);
