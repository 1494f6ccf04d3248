#include <windows.h>

#include <objidl.h>

#include "ui/gdiplus_bitmap_win.h"

#include <cstring>

#include "text/program_resource.h"

int32_t GdiPlusBitmap::Width() const { return bitmap != nullptr ? static_cast<int32_t>(bitmap->GetWidth()) : 0; }

int32_t GdiPlusBitmap::Height() const { return bitmap != nullptr ? static_cast<int32_t>(bitmap->GetHeight()) : 0; }

GdiPlusBitmapResource::~GdiPlusBitmapResource() { Release(); }

void GdiPlusBitmapResource::Release() {
    bitmap.reset();
    memory.Reset();
}

bool GdiPlusBitmapResource::Load(const char* name) {
    Release();
    ResourceBytes bytes;
    if (!FindProgramResource(name, "PNG", bytes)) return false;
    memory.Reset(GlobalAlloc(GMEM_MOVEABLE, bytes.size));
    if (!memory) return false;
    void* block = GlobalLock(memory.Get());
    if (block == nullptr) {
        Release();
        return false;
    }
    std::memcpy(block, bytes.data, bytes.size);
    GlobalUnlock(memory.Get());
    IStream* stream = nullptr;
    if (CreateStreamOnHGlobal(memory.Get(), FALSE, &stream) == S_OK) {
        bitmap.reset(Gdiplus::Bitmap::FromStream(stream));
        stream->Release();
    }
    if (bitmap != nullptr && bitmap->GetLastStatus() != Gdiplus::Ok) bitmap.reset();
    if (bitmap == nullptr) {
        Release();
        return false;
    }
    return true;
}
