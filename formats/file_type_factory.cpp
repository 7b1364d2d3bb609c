#include "file_type_factory.h"

#include "ebn_file_info.h"
#include "emi_file_info.h"
#include "mrc_file_info.h"
#include "raw_file_info.h"
#include "same_text.h"
#include "ser_file_info.h"

namespace Qel::Lumetra::ShellExt {

std::wstring GetExtension(const std::wstring& path) {
  const std::size_t dot = path.rfind(L'.');
  return dot == std::wstring::npos ? std::wstring() : path.substr(dot + 1);
}

bool IsSerExtension(const std::wstring& extension) {
  return SameIgnoringCase(extension, L"ser");
}

bool IsMrcExtension(const std::wstring& extension) {
  return SameIgnoringCase(extension, L"ali") || SameIgnoringCase(extension, L"rec") ||
         SameIgnoringCase(extension, L"mrc");
}

bool IsEbnExtension(const std::wstring& extension) {
  return SameIgnoringCase(extension, L"ebn");
}

bool IsEmiExtension(const std::wstring& extension) {
  return SameIgnoringCase(extension, L"emi");
}

bool IsRawExtension(const std::wstring& extension) {
  return SameIgnoringCase(extension, L"raw");
}

std::unique_ptr<FileTypeInfo> CreateFileTypeInfo(std::istream& stream, const std::wstring& extension) {
  if (IsSerExtension(extension)) return std::make_unique<SerFileInfo>(stream);
  if (IsMrcExtension(extension)) return std::make_unique<MrcFileInfo>(stream, extension);
  if (IsEbnExtension(extension)) return std::make_unique<EbnFileInfo>(stream);
  if (IsEmiExtension(extension)) return std::make_unique<EmiFileInfo>(stream);
  if (IsRawExtension(extension)) return std::make_unique<RawFileInfo>(stream);
  return nullptr;
}

}  // namespace Qel::Lumetra::ShellExt
