#include "app/single_instance.h"

#include <windows.h>

const char* const kInstanceName = "IronvaleUpdater";

// Releasing a mutex the wait did not get fails, and changes nothing.
void SingleInstance::Traits::Close(intptr_t value) {
    HANDLE mutex = reinterpret_cast<HANDLE>(value);
    ReleaseMutex(mutex);
    CloseHandle(mutex);
}

bool SingleInstance::Acquire() {
    HANDLE mutex = CreateMutexA(nullptr, FALSE, kInstanceName);
    if (mutex == nullptr) return false;
    guard.Reset(reinterpret_cast<intptr_t>(mutex));
    return WaitForSingleObject(mutex, 2) == WAIT_OBJECT_0;
}
