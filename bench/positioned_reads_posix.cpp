#include <fcntl.h>
#include <unistd.h>

#include <filesystem>
#include <vector>

#include "positioned_reads.h"

namespace Qel::Lumetra::ShellExt::Bench {

bool ReadAtPositions(const std::wstring& path, const PositionedReads& reads) {
  const int file = open(std::filesystem::path(path).c_str(), O_RDONLY | O_CLOEXEC);
  if (file == -1) return false;
  std::vector<char> bytes(reads.bytes);
  bool done = true;
  for (std::int64_t i = 0; i < reads.count && done; ++i) {
    done = pread(file, bytes.data(), bytes.size(), reads.first + i * reads.step) ==
           static_cast<ssize_t>(bytes.size());
  }
  close(file);
  return done;
}

}  // namespace Qel::Lumetra::ShellExt::Bench
