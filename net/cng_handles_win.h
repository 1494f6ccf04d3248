#pragma once

#include <windows.h>

#include <bcrypt.h>

#include "base/unique_handle.h"

// CNG's handle kinds, each with what closes it.
struct CngAlgorithmTraits {
    using Value = BCRYPT_ALG_HANDLE;
    static Value Invalid() { return nullptr; }
    static void Close(Value value) { BCryptCloseAlgorithmProvider(value, 0); }
};
using CngAlgorithm = UniqueHandle<CngAlgorithmTraits>;

struct CngKeyTraits {
    using Value = BCRYPT_KEY_HANDLE;
    static Value Invalid() { return nullptr; }
    static void Close(Value value) { BCryptDestroyKey(value); }
};
using CngKey = UniqueHandle<CngKeyTraits>;

struct CngHashTraits {
    using Value = BCRYPT_HASH_HANDLE;
    static Value Invalid() { return nullptr; }
    static void Close(Value value) { BCryptDestroyHash(value); }
};
using CngHash = UniqueHandle<CngHashTraits>;

// Holds nothing when the platform lacks the algorithm.
inline CngAlgorithm OpenCngAlgorithm(LPCWSTR id) {
    BCRYPT_ALG_HANDLE handle = nullptr;
    if (!BCRYPT_SUCCESS(BCryptOpenAlgorithmProvider(&handle, id, nullptr, 0))) return CngAlgorithm();
    return CngAlgorithm(handle);
}
