// SHA-256 and the signature check (CNG under Windows, OpenSSL natively), with keys and signatures made by the
// publisher's tool and one made by OpenSSL's command line.
#include <gtest/gtest.h>

#include <utility>

#include "net/sha256.h"
#include "net/signature_check.h"
#include "net/signature_formats.h"
#include "tests/support/test_files.h"
#include "tools/publisher/signing_key.h"

namespace {

// The second file takes several reads.
TEST(Sha256, GivesTheStandardDigestAlsoOfAFileLongerThanOneRead) {
    TempFolder folder;
    const std::pair<std::string, const char*> cases[] = {
        {"abc", "ba7816bf8f01cfea414140de5dae2223b00361a396177a9cb410ff61f20015ad"},
        {std::string(2000000, 'a'), "bcf7f9d1b4311c3352e60502255ce09a6744df84e8f2c89f79c4b5d74933a95a"},
    };
    for (const auto& [data, expected] : cases) {
        WriteTextFile(folder / "data", data);
        Sha256Digest digest{};
        int64_t length = 0;
        ASSERT_TRUE(Sha256OfFile(folder / "data", digest, length));
        EXPECT_EQ(length, static_cast<int64_t>(data.size()));
        EXPECT_EQ(HexDigits(digest.data(), digest.size()), expected);
    }
}

std::string Unhex(const std::string& hex) {
    std::string bytes;
    for (size_t i = 0; i + 1 < hex.size(); i += 2) bytes += static_cast<char>(std::stoi(hex.substr(i, 2), nullptr, 16));
    return bytes;
}

TEST(Signature, PassesOnlyASignatureByOneOfTheKeysOverTheseBytes) {
    const P256PrivateKey key = GenerateSigningKey();
    const P256PrivateKey other = GenerateSigningKey();
    const std::string data = "<IronvaleWestPatch><Version>2</Version></IronvaleWestPatch>\n";
    Sha256 hash;
    hash.Update(data.data(), data.size());
    const std::string signature = SignatureDer(SignDigest(key, hash.Finish()));
    const std::string keys = PublicKeyPem(other.publicKey) + PublicKeyPem(key.publicKey);
    const struct {
        std::string data, signature /* DER */, keys;
        const char* refusal;  // how the message goes on; empty: accepted
    } cases[] = {
        {data, signature, keys, ""},  // by the second of two keys
        // A signature `openssl dgst -sha256 -sign` made once, with the public half of its throw-away key; r needs
        // DER's sign byte.
        {"<IronvaleWestPatch><Version>7</Version></IronvaleWestPatch>\n",
         Unhex("3045022100c60c0337a4eafc87de4870dc9f1de6867ca3b5a6032aa92065ad34b31fbdd8f602200e57e5e01de8f750a38164f3"
               "22e1541bdff77525658dd2b642d13bdf03b5c36c"),
         "-----BEGIN PUBLIC KEY-----\n"
         "MFkwEwYHKoZIzj0CAQYIKoZIzj0DAQcDQgAEHO7oCmg60P30Mww6Xwy+/Es+6eh5\n"
         "vDOE0TlQGa/Lx+3xvwLYSFiX3URuZR1IbmLqDZQbag/9XnEKb4xEAsEtng==\n"
         "-----END PUBLIC KEY-----\n",
         ""},
        {data + " ", signature, keys, "does not match"},
        {data, signature, PublicKeyPem(other.publicKey), "does not match"},
        {data, Unhex("3007020200010201") + std::string(1, '\x01'), keys, "is not an ECDSA"},  // a needless zero
        {data, signature, "-----BEGIN PUBLIC KEY-----\n-----END PUBLIC KEY-----", "cannot be read."},
    };
    for (const auto& c : cases) {
        const std::string error = ErrorOf([&] { CheckSignature(c.data, c.signature, c.keys, "patchinfo.xml"); });
        EXPECT_TRUE(*c.refusal ? error.find(c.refusal) != error.npos && EndsWith(error, " (12)") : error.empty())
            << error;
    }
}

}  // namespace
