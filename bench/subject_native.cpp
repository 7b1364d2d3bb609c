#include <fstream>
#include <memory>

#include "file_type_factory.h"
#include "path_stream.h"
#include "subject.h"

namespace Qel::Lumetra::ShellExt::Bench {
namespace {

/// A file and its reader, as the shell objects hold them.
struct OpenedFile {
  explicit OpenedFile(const std::wstring& path) {
    OpenPath(stream, path.c_str());
    if (stream.is_open()) reader = CreateFileTypeInfo(stream, GetExtension(path));
  }

  bool valid() const { return reader && reader->IsValid(); }

  std::ifstream stream;
  std::unique_ptr<FileTypeInfo> reader;
};

}  // namespace

HBITMAP MakeThumbnail(const std::wstring& path, const SIZE& request) {
  const OpenedFile file(path);
  return file.valid() ? file.reader->CreateThumbnail(request) : nullptr;
}

bool OpenFile(const std::wstring& path) {
  return OpenedFile(path).valid();
}

bool ReadMetadata(const std::string& what, const std::wstring& path) {
  const OpenedFile file(path);
  if (what != "reader" || !file.valid()) return false;
  const FileTypeInfo& reader = *file.reader;
  const std::wstring texts = reader.GetTypeDescription() + reader.GetDataTypeName() + reader.GetComment();
  return reader.GetDimensions().width > 0 && reader.GetFrameCount() > 0 && reader.GetBitDepth() > 0 &&
         !texts.empty();
}

}  // namespace Qel::Lumetra::ShellExt::Bench
