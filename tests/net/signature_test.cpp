// SHA-256 and the check of a signed file (CNG under Windows, OpenSSL natively), with keys and signatures made by the
// publisher's tool and one made by OpenSSL's command line.
#include <gtest/gtest.h>

#include <atomic>
#include <functional>
#include <utility>

#include "base/file_operations.h"
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

struct Signed {
    std::string description, signature /* DER */, keyPem;
};

std::string Unhex(const std::string& hex) {
    std::string bytes;
    for (size_t i = 0; i + 1 < hex.size(); i += 2) bytes += static_cast<char>(std::stoi(hex.substr(i, 2), nullptr, 16));
    return bytes;
}

TEST(FileSignature, PassesOnlyTheKeysOwnSignatureOverTheseBytes) {
    const P256PrivateKey key = GenerateSigningKey();
    const P256PrivateKey other = GenerateSigningKey();
    // A signature `openssl dgst -sha256 -sign` made once, with the public half of its throw-away key; r needs DER's
    // sign byte.
    const Signed openssl{
        "<IronvaleWestPatch><Version>7</Version></IronvaleWestPatch>\n",
        Unhex("3045022100c60c0337a4eafc87de4870dc9f1de6867ca3b5a6032aa92065ad34b31fbdd8f602200e57e5e01de8f750a38164f32"
              "2e1541bdff77525658dd2b642d13bdf03b5c36c"),
        "-----BEGIN PUBLIC KEY-----\n"
        "MFkwEwYHKoZIzj0CAQYIKoZIzj0DAQcDQgAEHO7oCmg60P30Mww6Xwy+/Es+6eh5\n"
        "vDOE0TlQGa/Lx+3xvwLYSFiX3URuZR1IbmLqDZQbag/9XnEKb4xEAsEtng==\n"
        "-----END PUBLIC KEY-----\n"};
    const struct {
        const char* what;
        std::function<void(Signed&)> spoil;
        const char* refusal;  // how the message goes on; empty: accepted
    } cases[] = {
        {"as signed", [](Signed&) {}, ""},
        {"made by openssl", [&](Signed& s) { s = openssl; }, ""},
        {"one byte of the file changed", [](Signed& s) { s.description[10] ^= 0x20; }, "does not match"},
        {"checked with another key", [&](Signed& s) { s.keyPem = PublicKeyPem(other.publicKey); }, "does not match"},
        {"no signature file", [](Signed& s) { s.signature = "missing"; }, "cannot be read"},
        {"a needless zero", [](Signed& s) { s.signature = Unhex("3007020200010201") + std::string(1, '\x01'); },
         "is not an ECDSA"},
        {"no public key built in", [](Signed& s) { s.keyPem = "-----BEGIN PUBLIC KEY-----\n-----END PUBLIC KEY-----"; },
         "The publisher key built into the program cannot be read."},
    };
    TempFolder folder;
    for (const auto& item : cases) {
        SCOPED_TRACE(item.what);
        Signed input{"<IronvaleWestPatch><Version>2</Version></IronvaleWestPatch>\n", "", PublicKeyPem(key.publicKey)};
        WriteTextFile(folder / "patchinfo.xml", input.description);
        SignPatchDescription(folder.Path(), key);
        input.signature = ReadTextFile(folder / kDescriptionSignatureName);
        item.spoil(input);
        WriteTextFile(folder / "patchinfo.xml", input.description);
        RemoveFile(folder / kDescriptionSignatureName);
        if (input.signature != "missing") WriteTextFile(folder / kDescriptionSignatureName, input.signature);
        const std::string error = ErrorOf(
            [&] { CheckFileSignature(folder / "patchinfo.xml", folder / kDescriptionSignatureName, input.keyPem); });
        EXPECT_TRUE(*item.refusal ? error.find(item.refusal) != error.npos && EndsWith(error, " (12)") : error.empty())
            << error;
    }
}

}  // namespace
