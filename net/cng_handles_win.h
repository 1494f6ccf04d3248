#pragma once

#include <windows.h>

#include <bcrypt.h>

// CNG handles, each released by its holder.
class CngAlgorithm {
public:
    // Not open (IsOpen false) when the platform lacks the algorithm.
    explicit CngAlgorithm(LPCWSTR id) {
        if (!BCRYPT_SUCCESS(BCryptOpenAlgorithmProvider(&handle, id, nullptr, 0))) handle = nullptr;
    }
    CngAlgorithm(const CngAlgorithm&) = delete;
    CngAlgorithm& operator=(const CngAlgorithm&) = delete;
    ~CngAlgorithm() {
        if (handle != nullptr) BCryptCloseAlgorithmProvider(handle, 0);
    }
    bool IsOpen() const { return handle != nullptr; }

    BCRYPT_ALG_HANDLE handle = nullptr;
};

class CngKey {
public:
    CngKey() = default;
    CngKey(const CngKey&) = delete;
    CngKey& operator=(const CngKey&) = delete;
    ~CngKey() {
        if (handle != nullptr) BCryptDestroyKey(handle);
    }

    BCRYPT_KEY_HANDLE handle = nullptr;
};
