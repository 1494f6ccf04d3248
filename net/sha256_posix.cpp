#include <openssl/evp.h>

#include "base/exception.h"
#include "net/openssl_handles_posix.h"
#include "net/sha256.h"

struct Sha256::State {
    EvpDigestContext context{EVP_MD_CTX_new()};
};

Sha256::Sha256() : state(new State) {
    if (!state->context || EVP_DigestInit_ex(state->context.Get(), EVP_sha256(), nullptr) != 1) {
        throw Exception("SHA-256 is not available.");
    }
}

Sha256::~Sha256() = default;

void Sha256::Update(const void* data, size_t size) {
    if (EVP_DigestUpdate(state->context.Get(), data, size) != 1) throw Exception("SHA-256 failed.");
}

Sha256Digest Sha256::Finish() {
    Sha256Digest digest{};
    unsigned int length = 0;
    if (EVP_DigestFinal_ex(state->context.Get(), digest.data(), &length) != 1 || length != digest.size()) {
        throw Exception("SHA-256 failed.");
    }
    return digest;
}
