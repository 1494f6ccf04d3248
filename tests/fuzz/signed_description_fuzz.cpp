// The untrusted parts of a signed description: the signature file (its DER parsed, re-encoded byte for byte, and
// checked against a key), PEM text, and the description's version and archive list; and the latest version's signed
// statement. The input is a two-byte length, that many bytes of signature file, then the description (or statement).
#include <cstdlib>

#include "net/signature_check.h"
#include "net/signature_formats.h"
#include "net/version_statement.h"
#include "patch/patch_info_file.h"
#include "patch/patch_stages.h"
#include "tests/fuzz/fuzz_files.h"
#include "tools/publisher/signing_key.h"

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    static const std::string keyPem = PublicKeyPem(GenerateSigningKey().publicKey);
    if (size < 2) return 0;
    const size_t signatureSize = std::min<size_t>(size - 2, data[0] | data[1] << 8);
    const std::string signature(reinterpret_cast<const char*>(data + 2), signatureSize);
    const std::string description(reinterpret_cast<const char*>(data + 2 + signatureSize), size - 2 - signatureSize);

    // DER has one encoding per value: what parses must print back the same.
    P256Signature parsed{};
    if (ParseSignatureDer(signature, parsed) && SignatureDer(parsed) != signature) std::abort();
    P256PublicKey key{};
    if (ParsePublicKeyPem(description, key)) {
        P256PublicKey again{};
        if (!ParsePublicKeyPem(PublicKeyPem(key), again) || again != key) std::abort();
    }

    // A statement has one spelling: what parses is exactly what the publisher's tool writes of it.
    VersionStatement statement;
    std::string signedText;
    std::string statementSignature;
    if (ParseVersionStatement(description, statement, signedText, statementSignature) &&
        (StatementText(statement) != signedText ||
         signedText + "signature " + EncodeBase64(statementSignature) + "\n" != description)) {
        std::abort();
    }
    ExpectNoCrash([&] { CheckVersionStatement(description, keyPem + keyPem, "2", 0, 0); });

    const std::string path = WriteFuzzFile("patchinfo.xml", data + 2 + signatureSize, description.size());
    const std::string signaturePath = WriteFuzzFile("patchinfo.xml.sig", data + 2, signatureSize);
    ExpectNoCrash([&] { CheckFileSignature(path, signaturePath, keyPem); });
    ExpectNoCrash([&] {
        PatchInfoFile info;
        info.Load(path);
        ArchivesInFetchOrder(info);
    });
    return 0;
}
