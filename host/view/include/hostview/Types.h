#pragma once
// Basic types shared by the terminal, the host libraries and the add-on.
// The message channel carries a message number and one pointer-sized word.
#include <cstdint>

using UINT = std::uint32_t;
using WPARAM = std::uintptr_t;
using LPARAM = std::intptr_t;
using LRESULT = std::intptr_t;
// Colour as 0x00BBGGRR: red in the low byte, blue in the high byte.
using COLORREF = std::uint32_t;

constexpr COLORREF MakeColorRef(unsigned r, unsigned g, unsigned b) {
  return (r & 0xFFu) | ((g & 0xFFu) << 8) | ((b & 0xFFu) << 16);
}
constexpr unsigned ColorRefRed(COLORREF c) { return c & 0xFFu; }
constexpr unsigned ColorRefGreen(COLORREF c) { return (c >> 8) & 0xFFu; }
constexpr unsigned ColorRefBlue(COLORREF c) { return (c >> 16) & 0xFFu; }

#define HV_API __attribute__((visibility("default")))

// Pointers travel in the data word; these two helpers keep the casts in one place.
template <class T>
inline LPARAM ToLParam(T* p) { return reinterpret_cast<LPARAM>(p); }
template <class T>
inline T* FromLParam(LPARAM l) { return reinterpret_cast<T*>(l); }
