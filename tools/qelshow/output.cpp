#include "output.h"

#include <algorithm>
#include <cwctype>
#include <filesystem>
#include <fstream>
#include <optional>
#include <string_view>

#include "console.h"
#include "failure.h"
#include "file_list.h"
#include "page_writer.h"
#include "png.h"
#include "text_tools.h"

namespace Qel::Lumetra::ShellExt::Show {
namespace {

namespace fs = std::filesystem;

[[noreturn]] void Refuse(const std::wstring& path, const wchar_t* reason) {
  throw Failure(L"\"" + path + L"\" " + reason, kExitUsage);
}

bool Exists(const std::wstring& path) {
  return GetFileAttributesW(path.c_str()) != INVALID_FILE_ATTRIBUTES;
}

bool IsFolder(const std::wstring& path) {
  std::error_code ignored;
  return fs::is_directory(path, ignored);
}

/// Identifies a file, whichever path is used for it.
struct Identity {
  DWORD volume;
  DWORD high;
  DWORD low;
  bool operator==(const Identity&) const = default;
};

std::optional<Identity> IdentityOf(const std::wstring& path) {
  const Com::OwnedHandle file(CreateFileW(path.c_str(), FILE_READ_ATTRIBUTES,
                                          FILE_SHARE_READ | FILE_SHARE_WRITE | FILE_SHARE_DELETE, nullptr,
                                          OPEN_EXISTING, FILE_FLAG_BACKUP_SEMANTICS, nullptr));
  BY_HANDLE_FILE_INFORMATION facts{};
  if (!file || !GetFileInformationByHandle(file.Get(), &facts)) return std::nullopt;
  return Identity{facts.dwVolumeSerialNumber, facts.nFileIndexHigh, facts.nFileIndexLow};
}

/// Returns the first bytes of a file, up to `count`.
std::string Beginning(const std::wstring& path, std::size_t count) {
  std::string bytes(count, '\0');
  std::ifstream file(fs::path(path), std::ios::binary);
  file.read(bytes.data(), static_cast<std::streamsize>(count));
  bytes.resize(static_cast<std::size_t>(file.gcount()));
  return bytes;
}

constexpr const wchar_t* kForeign =
    L"was not written by qelshow and is not replaced: delete it, or choose another name with --out.";

void RefuseSupportedExtension(const std::wstring& path) {
  if (IsSupported(path))
    Refuse(path, L"has the file-name extension of a microscopy file: choose another name with --out.");
}

bool IsOwnPng(const std::wstring& path) {
  return IsMarkedPng(Beginning(path, kMarkedPngBytes));
}

}  // namespace

void CheckPngOutput(const std::wstring& path, const std::wstring& input) {
  const std::optional<Identity> existing = IdentityOf(path);
  if (existing && existing == IdentityOf(input))
    Refuse(path, L"is the input file and is not replaced: choose another name with --out.");
  if (IsFolder(path)) Refuse(path, L"is a folder: name a file with --out.");
  RefuseSupportedExtension(path);
  if (Exists(path) && !IsOwnPng(path)) Refuse(path, kForeign);
}

void CheckPageOutput(const std::wstring& folder, std::size_t files) {
  if (!IsFolder(folder)) {
    RefuseSupportedExtension(folder);
    if (Exists(folder)) Refuse(folder, L"is a file: name a folder with --out.");
  }
  const std::wstring page = PagePath(folder);
  if (Exists(page) && !IsMarkedPage(Beginning(page, kMarkedPageBytes))) Refuse(page, kForeign);
  for (std::size_t i = 1; i <= files; ++i) {
    const std::wstring thumbnail = ThumbnailPath(folder, i);
    if (Exists(thumbnail) && !IsOwnPng(thumbnail)) Refuse(thumbnail, kForeign);
  }
}

bool IsThumbnailOfPage(const std::wstring& path) {
  const fs::path name = fs::path(path).filename();
  return name.extension() == L".png" && std::ranges::all_of(name.stem().wstring(), std::iswdigit) &&
         IsOwnPng(path);
}

void CannotWrite(const std::wstring& path, DWORD error) {
  throw Failure(L"\"" + path + L"\" cannot be written: " + SystemErrorText(error) + L".");
}

void CannotWrite(const std::wstring& path, const std::error_code& error) {
  throw Failure(L"\"" + path + L"\" cannot be written: " + SystemErrorText(error) + L".");
}

Com::OwnedHandle CreateNewFile(const std::wstring& path) {
  Com::OwnedHandle file(CreateFileW(path.c_str(), GENERIC_WRITE, FILE_SHARE_READ, nullptr, CREATE_NEW,
                                    FILE_ATTRIBUTE_NORMAL, nullptr));
  if (!file) CannotWrite(path, GetLastError());
  return file;
}

void WriteNewFile(const std::wstring& path, const std::vector<std::uint8_t>& bytes) {
  Com::OwnedHandle file = CreateNewFile(path);
  if (WriteBytes(file.Get(), bytes.data(), bytes.size())) return;
  const DWORD error = GetLastError();
  file.Reset();
  DeleteFileW(path.c_str());
  CannotWrite(path, error);
}

void MoveFileTo(const std::wstring& from, const std::wstring& to) {
  if (!MoveFileExW(from.c_str(), to.c_str(), MOVEFILE_REPLACE_EXISTING)) CannotWrite(to, GetLastError());
}

void ReplaceFileAt(const std::wstring& path, const std::vector<std::uint8_t>& bytes) {
  std::wstring beside = path + L".part";
  for (int i = 2; Exists(beside); ++i) beside = path + L".part" + std::to_wstring(i);
  WriteNewFile(beside, bytes);
  try {
    MoveFileTo(beside, path);
  } catch (...) {
    DeleteFileW(beside.c_str());
    throw;
  }
}

}  // namespace Qel::Lumetra::ShellExt::Show
