#include <fcntl.h>
#include <unistd.h>

#include <filesystem>
#include <fstream>
#include <memory>
#include <vector>

#include "file_type_factory.h"
#include "path_stream.h"
#include "subject.h"

namespace Qel::Lumetra::ShellExt::Bench {
namespace {

/// An open file and its reader, as the shell objects own them.
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

bool ReadMetadata(const std::string& view, const std::wstring& path) {
  const OpenedFile file(path);
  if (view != "reader" || !file.valid()) return false;
  const FileTypeInfo& reader = *file.reader;
  const std::wstring texts = reader.GetTypeDescription() + reader.GetDataTypeName() + reader.GetComment();
  return reader.GetDimensions().width > 0 && reader.GetFrameCount() > 0 && reader.GetBitDepth() > 0 &&
         !texts.empty();
}

bool ReadBlocks(const std::wstring& path, const Blocks& blocks) {
  const int file = open(std::filesystem::path(path).c_str(), O_RDONLY | O_CLOEXEC);
  if (file == -1) return false;
  std::vector<char> bytes(blocks.bytes);
  bool done = true;
  for (std::int64_t i = 0; i < blocks.count && done; ++i) {
    done = pread(file, bytes.data(), bytes.size(), blocks.first + i * blocks.distance) ==
           static_cast<ssize_t>(bytes.size());
  }
  close(file);
  return done;
}

}  // namespace Qel::Lumetra::ShellExt::Bench
