#include "file_type_factory.h"

#include "mrc_file_info.h"
#include "same_text.h"

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
  if (IsMrcExtension(extension)) return std::make_unique<MrcFileInfo>(stream, extension);
  return nullptr;
}

}  // namespace Qel::Lumetra::ShellExt
