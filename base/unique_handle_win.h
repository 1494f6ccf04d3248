#pragma once

// The kernel's and the registry's handle kinds, each with what closes it.
// Only Windows code includes this header.

#include <windows.h>

#include "base/unique_handle.h"

// Processes, threads, events, mutexes and tokens: null for none.
struct KernelHandleTraits {
    using Value = HANDLE;
    static Value Invalid() { return nullptr; }
    static void Close(Value value) { CloseHandle(value); }
};
using UniqueKernelHandle = UniqueHandle<KernelHandleTraits>;

// Files from CreateFile, which reports failure as INVALID_HANDLE_VALUE.
struct FileHandleTraits {
    using Value = HANDLE;
    static Value Invalid() { return INVALID_HANDLE_VALUE; }
    static void Close(Value value) { CloseHandle(value); }
};
using UniqueFileHandle = UniqueHandle<FileHandleTraits>;

// A folder listing from FindFirstFile.
struct FindHandleTraits {
    using Value = HANDLE;
    static Value Invalid() { return INVALID_HANDLE_VALUE; }
    static void Close(Value value) { FindClose(value); }
};
using UniqueFindHandle = UniqueHandle<FindHandleTraits>;

struct RegistryKeyTraits {
    using Value = HKEY;
    static Value Invalid() { return nullptr; }
    static void Close(Value value) { RegCloseKey(value); }
};
using UniqueRegistryKey = UniqueHandle<RegistryKeyTraits>;
