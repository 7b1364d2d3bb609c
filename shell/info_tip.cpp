#include "info_tip.h"

#include <shlobj.h>
#include <shlwapi.h>

#include <array>
#include <cstdint>
#include <cstring>

#include "com_ptr.h"
#include "string_ids.h"
#include "text.h"

namespace Qel::Lumetra::ShellExt {
namespace {

constexpr int kTextRoom = 256;  // wide characters for a date and time, or for a size

std::wstring Label(std::uint32_t id) {
  return LoadResourceString(id) + L": ";
}

/// Returns the date and time of day in the user's time zone and format; empty if the system cannot convert
/// them.
std::wstring LocalTime(const FILETIME& time) {
  SYSTEMTIME utc{};
  if (!FileTimeToSystemTime(&time, &utc)) return {};
  SYSTEMTIME local{};
  if (!SystemTimeToTzSpecificLocalTime(nullptr, &utc, &local)) local = utc;

  std::array<wchar_t, kTextRoom + 1> text{};  // keeps its terminator even if the date fills the rest
  const int dateEnd =
      GetDateFormatW(LOCALE_USER_DEFAULT, DATE_SHORTDATE, &local, nullptr, text.data(), kTextRoom);
  if (dateEnd == 0) return {};
  wchar_t* const timeBegin = text.data() + dateEnd;
  timeBegin[-1] = L' ';
  const int timeLength =
      GetTimeFormatW(LOCALE_USER_DEFAULT, TIME_NOSECONDS, &local, nullptr, timeBegin, kTextRoom - dateEnd);
  return timeLength > 0 ? text.data() : std::wstring();
}

/// Returns the lines from the file system, each with a line break before it; empty if the file no longer
/// exists.
std::wstring FileLines(const std::wstring& path) {
  WIN32_FILE_ATTRIBUTE_DATA attributes{};
  if (!GetFileAttributesExW(path.c_str(), GetFileExInfoStandard, &attributes)) return {};
  std::wstring lines;
  if (const std::wstring time = LocalTime(attributes.ftLastWriteTime); !time.empty()) {
    lines += L"\r\n" + Label(IDS_DATE_MODIFIED) + time;
  }
  // Only the low half of the size is shown, so the size is modulo 4 GiB. Intentional.
  std::array<wchar_t, kTextRoom> size{};
  if (StrFormatByteSizeW(std::int64_t{attributes.nFileSizeLow}, size.data(), kTextRoom) != nullptr) {
    lines += L"\r\n" + Label(IDS_SIZE) + size.data();
  }
  return lines;
}

/// Returns, for instance, "61 images (4096 \u00D7 4096) 16 bit signed". Only people read this line, hence the
/// multiplication sign instead of the letter x of the properties.
std::wstring Dimensions(const FileTypeInfo& reader) {
  const std::int32_t frames = reader.GetFrameCount();
  const Size2 size = reader.GetDimensions();
  std::wstring text;
  if (frames > 1) text = std::to_wstring(frames) + L" " + LoadResourceString(IDS_IMAGES) + L" ";
  text += L"(" + std::to_wstring(size.width) + L" \u00D7 " + std::to_wstring(size.height) + L") ";
  return text + reader.GetDataTypeName();
}

std::wstring TipText(const FileTypeInfo& reader, const std::wstring& path) {
  std::wstring text = Label(IDS_DIMENSIONS) + Dimensions(reader);
  text += L"\r\n" + Label(IDS_TYPE) + reader.GetTypeDescription();
  text += FileLines(path);
  if (const std::wstring comment = reader.GetComment(); !comment.empty()) text += L"\r\n" + comment;
  return text;
}

}  // namespace

HRESULT MakeInfoTip(const FileTypeInfo& reader, const std::wstring& path, wchar_t** tip) {
  Com::ComPtr<IMalloc> allocator;
  if (const HRESULT result = SHGetMalloc(allocator.Put()); FAILED(result)) return result;
  const std::wstring text = TipText(reader, path);
  const std::size_t bytes = (text.size() + 1) * sizeof(wchar_t);
  void* const copy = allocator->Alloc(bytes);
  if (copy == nullptr) return E_OUTOFMEMORY;
  std::memcpy(copy, text.c_str(), bytes);
  *tip = static_cast<wchar_t*>(copy);
  return S_OK;
}

}  // namespace Qel::Lumetra::ShellExt
