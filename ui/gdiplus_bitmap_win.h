#pragma once

// Pictures of the main window as GDI+ bitmaps. Only Windows code includes
// this header.

#include <windows.h>

// GDI+ needs the COM declarations that WIN32_LEAN_AND_MEAN leaves out.
#include <objidl.h>

#include <gdiplus.h>

#include <memory>

#include "base/unique_handle.h"

// Owns one GDI+ bitmap, or none.
class GdiPlusBitmap {
public:
    GdiPlusBitmap() = default;
    GdiPlusBitmap(const GdiPlusBitmap&) = delete;
    GdiPlusBitmap& operator=(const GdiPlusBitmap&) = delete;
    virtual ~GdiPlusBitmap() = default;

    Gdiplus::Bitmap* Get() const { return bitmap.get(); }
    // Width and height in pixels; 0 without a bitmap.
    int32_t Width() const;
    int32_t Height() const;

protected:
    std::unique_ptr<Gdiplus::Bitmap> bitmap;
};

// A PNG resource of the program as a bitmap. GDI+ may decode the picture
// lazily through the stream it was made from, so the memory block behind
// that stream lives as long as the bitmap does.
class GdiPlusBitmapResource : public GdiPlusBitmap {
public:
    GdiPlusBitmapResource() = default;
    ~GdiPlusBitmapResource() override;

    // Loads the resource name of type "PNG" of the program's own module.
    // False, leaving no bitmap, on any failure.
    bool Load(const char* name);
    // Destroys the bitmap, then frees its memory block.
    void Release();

private:
    struct GlobalMemoryTraits {
        using Value = HGLOBAL;
        static Value Invalid() { return nullptr; }
        static void Close(Value value) { GlobalFree(value); }
    };
    UniqueHandle<GlobalMemoryTraits> memory;
};
