// A temporary folder for the files that a test writes.
#pragma once

#include <cstdint>
#include <filesystem>
#include <string_view>

namespace Qel::Lumetra::ShellExt::Testing {

/// Makes an empty folder. The destructor deletes it and everything in it.
class TempFolder {
 public:
  TempFolder();
  ~TempFolder();
  TempFolder(const TempFolder&) = delete;
  TempFolder& operator=(const TempFolder&) = delete;

  const std::filesystem::path& path() const { return path_; }

  /// Writes the file `name`, making its folders first. Returns its full path.
  std::filesystem::path Write(const std::filesystem::path& name, std::string_view bytes) const;

 private:
  std::filesystem::path path_;
};

/// Extends a file to `size` bytes. The added bytes are zeros and take no space on the disk.
void Lengthen(const std::filesystem::path& file, std::uintmax_t size);

}  // namespace Qel::Lumetra::ShellExt::Testing
