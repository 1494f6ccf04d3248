#pragma once

#include <openssl/evp.h>

#include "base/unique_handle.h"

// OpenSSL's object kinds, each with what frees it.
struct EvpKeyTraits {
    using Value = EVP_PKEY*;
    static Value Invalid() { return nullptr; }
    static void Close(Value value) { EVP_PKEY_free(value); }
};
using EvpKey = UniqueHandle<EvpKeyTraits>;

struct EvpKeyContextTraits {
    using Value = EVP_PKEY_CTX*;
    static Value Invalid() { return nullptr; }
    static void Close(Value value) { EVP_PKEY_CTX_free(value); }
};
using EvpKeyContext = UniqueHandle<EvpKeyContextTraits>;

struct EvpDigestContextTraits {
    using Value = EVP_MD_CTX*;
    static Value Invalid() { return nullptr; }
    static void Close(Value value) { EVP_MD_CTX_free(value); }
};
using EvpDigestContext = UniqueHandle<EvpDigestContextTraits>;
