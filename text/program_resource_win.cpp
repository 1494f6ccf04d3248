#include <windows.h>

#include "text/program_resource.h"

bool FindProgramResource(const char* name, const char* type, ResourceBytes& bytes) {
    HRSRC info = FindResourceA(nullptr, name, type);
    if (info == nullptr) return false;
    const DWORD size = SizeofResource(nullptr, info);
    HGLOBAL loaded = LoadResource(nullptr, info);
    if (loaded == nullptr || size == 0) return false;
    const void* data = LockResource(loaded);
    if (data == nullptr) return false;
    bytes.data = static_cast<const uint8_t*>(data);
    bytes.size = size;
    return true;
}
