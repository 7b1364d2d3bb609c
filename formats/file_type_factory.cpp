#include "file_type_factory.h"

#include <type_traits>

#include "file_kinds.h"
#include "image_file_info.h"

namespace Qel::Lumetra::ShellExt {
namespace {

template <Parser KindParser>
bool IsExtensionOf(const std::wstring& extension) {
  bool isIts = false;
  WithKindOf(extension, [&]<class RowParser>(const FileKind<RowParser>&) {
    isIts = std::is_same_v<RowParser, KindParser>;
  });
  return isIts;
}

}  // namespace

std::wstring GetExtension(const std::wstring& path) {
  const std::size_t dot = path.rfind(L'.');
  return dot == std::wstring::npos ? std::wstring() : path.substr(dot + 1);
}

bool IsSerExtension(const std::wstring& extension) {
  return IsExtensionOf<SerParser>(extension);
}

bool IsMrcExtension(const std::wstring& extension) {
  return IsExtensionOf<MrcParser>(extension);
}

bool IsEbnExtension(const std::wstring& extension) {
  return IsExtensionOf<EbnParser>(extension);
}

bool IsEmiExtension(const std::wstring& extension) {
  return IsExtensionOf<EmiParser>(extension);
}

bool IsRawExtension(const std::wstring& extension) {
  return IsExtensionOf<RawParser>(extension);
}

std::unique_ptr<FileTypeInfo> CreateFileTypeInfo(std::istream& stream, const std::wstring& extension) {
  std::unique_ptr<FileTypeInfo> reader;
  WithKindOf(extension, [&]<class KindParser>(const FileKind<KindParser>&) {
    reader = std::make_unique<ImageFileInfo<KindParser>>(stream, extension);
  });
  return reader;
}

}  // namespace Qel::Lumetra::ShellExt
