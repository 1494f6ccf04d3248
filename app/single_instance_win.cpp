#include "app/single_instance.h"

#include <windows.h>

const char* const kInstanceName = "IronvaleUpdater";

bool SingleInstance::Acquire() {
    HANDLE mutex = CreateMutexA(nullptr, FALSE, kInstanceName);
    if (mutex == nullptr) return false;
    handle = reinterpret_cast<long long>(mutex);
    return WaitForSingleObject(mutex, 2) == WAIT_OBJECT_0;
}

void SingleInstance::Release() {
    if (handle == -1) return;
    HANDLE mutex = reinterpret_cast<HANDLE>(handle);
    ReleaseMutex(mutex);
    CloseHandle(mutex);
    handle = -1;
}
