// A folder of a test's own for the files that it writes.
#pragma once

#include <cstdint>
#include <filesystem>
#include <string_view>

namespace Qel::Lumetra::ShellExt::Testing {

/// Makes an empty folder, and deletes it with all it holds when it goes.
class TempFolder {
 public:
  TempFolder();
  ~TempFolder();
  TempFolder(const TempFolder&) = delete;
  TempFolder& operator=(const TempFolder&) = delete;

  const std::filesystem::path& path() const { return path_; }

  /// Writes the file `name`, with the folders on the way to it; returns its full path.
  std::filesystem::path Write(const std::filesystem::path& name, std::string_view bytes) const;

 private:
  std::filesystem::path path_;
};

/// Makes a file larger. What is new holds zeros and takes no space on the disk.
void Lengthen(const std::filesystem::path& file, std::uintmax_t size);

}  // namespace Qel::Lumetra::ShellExt::Testing
