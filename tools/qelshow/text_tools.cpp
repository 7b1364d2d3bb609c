#include "text_tools.h"

#include <objbase.h>

#include <algorithm>
#include <array>
#include <cstdio>
#include <cwctype>
#include <iterator>

namespace Qel::Lumetra::ShellExt::Show {

std::string Utf8(std::wstring_view text) {
  const int length = static_cast<int>(text.size());
  std::string utf8(static_cast<std::size_t>(
                       WideCharToMultiByte(CP_UTF8, 0, text.data(), length, nullptr, 0, nullptr, nullptr)),
                   '\0');
  WideCharToMultiByte(CP_UTF8, 0, text.data(), length, utf8.data(), static_cast<int>(utf8.size()), nullptr,
                      nullptr);
  return utf8;
}

namespace {

std::wstring Decoded(std::string_view bytes, UINT codePage, DWORD flags) {
  const int length = static_cast<int>(bytes.size());
  std::wstring text(
      static_cast<std::size_t>(MultiByteToWideChar(codePage, flags, bytes.data(), length, nullptr, 0)),
      L'\0');
  MultiByteToWideChar(codePage, flags, bytes.data(), length, text.data(), static_cast<int>(text.size()));
  return text;
}

}  // namespace

std::wstring Wide(std::string_view utf8) {
  return Decoded(utf8, CP_UTF8, 0);
}

std::wstring TextOfFile(std::string_view bytes) {
  constexpr UINT kWestern = 1252;
  const std::string_view text = bytes.substr(0, bytes.find('\0'));
  std::wstring decoded = Decoded(text, CP_UTF8, MB_ERR_INVALID_CHARS);
  if (decoded.empty()) decoded = Decoded(text, kWestern, 0);
  return decoded;
}

std::wstring Lowered(std::wstring_view text) {
  std::wstring lowered(text);
  for (wchar_t& c : lowered) c = static_cast<wchar_t>(std::towlower(c));
  return lowered;
}

std::wstring HexCode(std::uint32_t code) {
  std::array<wchar_t, 16> text{};
  std::swprintf(text.data(), text.size(), L"0x%08X", static_cast<unsigned>(code));
  return text.data();
}

namespace {

/// Returns the system's text for a code, without a full stop; an empty string if it has none.
std::wstring SystemMessage(DWORD code) {
  std::array<wchar_t, 512> text{};
  const DWORD length = FormatMessageW(FORMAT_MESSAGE_FROM_SYSTEM | FORMAT_MESSAGE_IGNORE_INSERTS, nullptr,
                                      code, 0, text.data(), static_cast<DWORD>(text.size()), nullptr);
  const std::wstring_view message(text.data(), length);
  return std::wstring(message.substr(0, message.find_last_not_of(L" .\r\n") + 1));
}

}  // namespace

std::wstring SystemErrorText(DWORD error) {
  const std::wstring message = SystemMessage(error);
  const std::wstring code = L"error " + std::to_wstring(error);
  return message.empty() ? code : message + L" (" + code + L")";
}

std::wstring SystemErrorText(const std::error_code& error) {
  if (error.category() == std::system_category()) return SystemErrorText(static_cast<DWORD>(error.value()));
  return Wide(error.message());
}

std::wstring ResultText(HRESULT result) {
  struct Known {
    HRESULT result;
    const wchar_t* meaning;
  };
  static constexpr Known kKnown[] = {
      {S_FALSE, L"no value"},
      {E_FAIL, L"unspecified failure"},
      {E_NOTIMPL, L"not implemented"},
      {E_NOINTERFACE, L"no such interface"},
      {E_UNEXPECTED, L"unexpected failure"},
      {E_OUTOFMEMORY, L"out of memory"},
      {CLASS_E_CLASSNOTAVAILABLE, L"no such class"},
      {REGDB_E_CLASSNOTREG, L"class not registered"},
  };
  for (const Known& known : kKnown) {
    if (known.result == result) return known.meaning;
  }
  const auto code = static_cast<std::uint32_t>(result);
  const std::wstring message = SystemMessage(code);
  return message.empty() ? HexCode(code) : message + L" (" + HexCode(code) + L")";
}

std::wstring ProcessEndText(DWORD exitCode) {
  struct Known {
    DWORD code;
    const wchar_t* meaning;
  };
  static constexpr Known kKnown[] = {
      {EXCEPTION_INT_DIVIDE_BY_ZERO, L"integer division by zero"},
      {EXCEPTION_ACCESS_VIOLATION, L"access violation"},
      {EXCEPTION_STACK_OVERFLOW, L"stack overflow"},
      {EXCEPTION_ILLEGAL_INSTRUCTION, L"illegal instruction"},
      {0xC0000374u, L"heap corruption"},
      {0xC0000409u, L"stack buffer overrun"},
  };
  for (const Known& known : kKnown) {
    if (known.code == exitCode) return HexCode(exitCode) + L" (" + known.meaning + L")";
  }
  return HexCode(exitCode);
}

std::wstring GuidText(const GUID& guid) {
  std::array<wchar_t, 40> text{};
  StringFromGUID2(guid, text.data(), static_cast<int>(text.size()));
  return text.data();
}

std::wstring SpelledGuid(const std::wstring& text) {
  GUID guid{};
  return SUCCEEDED(CLSIDFromString(text.c_str(), &guid)) ? GuidText(guid) : text;
}

std::wstring AbsolutePath(const std::wstring& path) {
  std::wstring absolute(GetFullPathNameW(path.c_str(), 0, nullptr, nullptr), L'\0');
  absolute.resize(
      GetFullPathNameW(path.c_str(), static_cast<DWORD>(absolute.size()), absolute.data(), nullptr));
  return absolute.empty() ? path : absolute;
}

std::wstring OwnPath() {
  std::wstring path(32768, L'\0');
  path.resize(GetModuleFileNameW(nullptr, path.data(), static_cast<DWORD>(path.size())));
  return path;
}

std::wstring Padded(std::wstring_view text, std::size_t width) {
  std::wstring padded(text);
  if (padded.size() < width) padded.append(width - padded.size(), L' ');
  return padded;
}

std::wstring Grid(const std::vector<std::vector<std::wstring>>& rows) {
  std::vector<std::size_t> widths;
  for (const auto& row : rows) {
    widths.resize(std::max(widths.size(), row.size()));
    for (std::size_t i = 0; i < row.size(); ++i) widths[i] = std::max(widths[i], row[i].size());
  }
  std::wstring text;
  for (const auto& row : rows) {
    std::wstring line = L"    ";
    for (std::size_t i = 0; i < row.size(); ++i) line += Padded(row[i], widths[i] + 2);
    line.erase(line.find_last_not_of(L' ') + 1);
    text += line + L"\n";
  }
  return text;
}

}  // namespace Qel::Lumetra::ShellExt::Show
