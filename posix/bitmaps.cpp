// Implements DIB sections as blocks of memory.
#include <windows.h>

#include <algorithm>
#include <cstdlib>
#include <cstring>
#include <limits>
#include <memory>
#include <new>
#include <vector>

struct HBITMAP__ {
  DIBSECTION section;
  std::vector<RGBQUAD> colours;
  std::unique_ptr<BYTE[]> bits;
};

struct HDC__ {
  HBITMAP__* selected = nullptr;
};

HDC CreateCompatibleDC(HDC) {
  return new (std::nothrow) HDC__;
}

BOOL DeleteDC(HDC dc) {
  delete dc;
  return 1;
}

// Returns null, and never throws, if there is no memory or if the number of bytes does not fit into the
// header's 32 bits.
HBITMAP CreateDIBSection(HDC, const BITMAPINFO* info, UINT, void** bits, HANDLE, DWORD) try {
  if (bits != nullptr) *bits = nullptr;
  const BITMAPINFOHEADER& header = info->bmiHeader;
  if (header.biWidth <= 0 || header.biHeight == 0) return nullptr;

  auto bitmap = std::make_unique<HBITMAP__>();
  const std::int64_t rows = std::abs(std::int64_t{header.biHeight});
  const std::int64_t rowBytes = (std::int64_t{header.biWidth} * header.biBitCount + 31) / 32 * 4;
  if (rowBytes > std::numeric_limits<DWORD>::max() / rows) return nullptr;
  bitmap->bits = std::make_unique<BYTE[]>(static_cast<std::size_t>(rows * rowBytes));
  bitmap->section.dsBm = {0,
                          header.biWidth,
                          static_cast<LONG>(rows),
                          static_cast<LONG>(rowBytes),
                          header.biPlanes,
                          header.biBitCount,
                          bitmap->bits.get()};
  bitmap->section.dsBmih = header;
  const auto* const colours =
      reinterpret_cast<const RGBQUAD*>(reinterpret_cast<const BYTE*>(info) + header.biSize);
  bitmap->colours.assign(colours, colours + header.biClrUsed);
  if (bits != nullptr) *bits = bitmap->bits.get();
  return bitmap.release();
} catch (const std::bad_alloc&) {
  return nullptr;
}

BOOL DeleteObject(HGDIOBJ object) {
  delete static_cast<HBITMAP__*>(object);
  return 1;
}

int GetObjectW(HANDLE object, int size, void* data) {
  if (object == nullptr || size < 0) return 0;
  const auto bytes = std::min(static_cast<std::size_t>(size), sizeof(DIBSECTION));
  std::memcpy(data, &static_cast<HBITMAP__*>(object)->section, bytes);
  return static_cast<int>(bytes);
}

HGDIOBJ SelectObject(HDC dc, HGDIOBJ object) {
  HGDIOBJ previous = dc->selected;
  dc->selected = static_cast<HBITMAP__*>(object);
  return previous;
}

UINT GetDIBColorTable(HDC dc, UINT first, UINT count, RGBQUAD* colours) {
  if (dc->selected == nullptr) return 0;
  const std::vector<RGBQUAD>& table = dc->selected->colours;
  if (first >= table.size()) return 0;
  const UINT copied = std::min(count, static_cast<UINT>(table.size()) - first);
  std::copy_n(table.begin() + first, copied, colours);
  return copied;
}
