#pragma once

// GDI's handle kinds, each with what releases it. Only Windows code includes
// this header.

#include <windows.h>

#include "base/unique_handle.h"

// Fonts, bitmaps and the other objects DeleteObject ends.
template <typename Object>
struct GdiObjectTraits {
    using Value = Object;
    static Value Invalid() { return nullptr; }
    static void Close(Value value) { DeleteObject(value); }
};
using UniqueFont = UniqueHandle<GdiObjectTraits<HFONT>>;
using UniqueBitmap = UniqueHandle<GdiObjectTraits<HBITMAP>>;

// A device context of CreateCompatibleDC.
struct MemoryDcTraits {
    using Value = HDC;
    static Value Invalid() { return nullptr; }
    static void Close(Value value) { DeleteDC(value); }
};
using UniqueMemoryDc = UniqueHandle<MemoryDcTraits>;

// The screen's device context, GetDC(nullptr).
struct ScreenDcTraits {
    using Value = HDC;
    static Value Invalid() { return nullptr; }
    static void Close(Value value) { ReleaseDC(nullptr, value); }
};
using UniqueScreenDc = UniqueHandle<ScreenDcTraits>;
