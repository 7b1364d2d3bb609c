// Readers share no state, so any number of threads may read files of every kind at the same time. Also built
// with ThreadSanitizer (preset linux-tsan).
#include <gtest/gtest.h>

#include <atomic>
#include <cstddef>
#include <cstdint>
#include <istream>
#include <string>
#include <thread>
#include <vector>

#include "ask_everything.h"
#include "memory_buffer.h"
#include "sample_files.h"

namespace Qel::Lumetra::ShellExt::Testing {
namespace {

struct InputFile {
  std::wstring extension;
  std::string bytes;
};

std::vector<InputFile> AllFiles() {
  std::vector<InputFile> files;
  for (const std::string kind : kSampleKinds) {
    for (const SampleFile& sample : SampleFiles(kind)) {
      files.push_back({{kind.begin(), kind.end()}, sample.bytes});
    }
  }
  return files;
}

/// Returns the sum over the bitmaps of each file. Begins with the file `first`, so that threads read
/// different files.
std::vector<std::uint64_t> AskAll(const std::vector<InputFile>& files, std::size_t first) {
  std::vector<std::uint64_t> sums(files.size());
  for (std::size_t i = 0; i < files.size(); ++i) {
    const std::size_t number = (first + i) % files.size();
    MemoryBuffer buffer(files[number].bytes);
    std::istream stream(&buffer);
    const Answers answers = AskEverything(stream, files[number].extension);
    EXPECT_TRUE(answers.valid);
    sums[number] = answers.bitmapSum;
  }
  return sums;
}

TEST(ReaderThreads, GiveTheSameAnswersAsOneThread) {
  constexpr std::size_t kThreads = 8;
  const std::vector<InputFile> files = AllFiles();
  std::vector<std::vector<std::uint64_t>> sums(kThreads);
  std::atomic<bool> go = false;
  std::vector<std::thread> threads;
  for (std::size_t i = 0; i < kThreads; ++i) {
    threads.emplace_back([&, i] {
      while (!go) std::this_thread::yield();
      sums[i] = AskAll(files, i * files.size() / kThreads);
    });
  }
  go = true;
  for (std::thread& thread : threads) thread.join();
  // This thread asks last, so that the other threads race for everything that is made on first use.
  const auto alone = AskAll(files, 0);
  for (const auto& sum : sums) EXPECT_EQ(sum, alone);
}

}  // namespace
}  // namespace Qel::Lumetra::ShellExt::Testing
