// The fuzzer of a file kind, built once for each: the input is the file.
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <istream>
#include <string_view>

#include "ask_everything.h"
#include "memory_buffer.h"

namespace {

using Qel::Lumetra::ShellExt::Testing::AskEverything;
using Qel::Lumetra::ShellExt::Testing::MemoryBuffer;

void Ask(MemoryBuffer& buffer) {
  std::istream stream(&buffer);
  const auto answers = AskEverything(stream, QEL_FILE_KIND);
  if (answers.wrong.empty()) return;
  std::fprintf(stderr, "%s\n", answers.wrong.c_str());
  std::abort();
}

/// A number that any change of the input changes: which read fails, and how, is the input's own choice, so
/// that an input alone repeats what it found.
std::uint64_t Choice(std::string_view bytes) {
  std::uint64_t hash = 0xCBF29CE484222325;
  for (const char byte : bytes) hash = (hash ^ static_cast<unsigned char>(byte)) * 0x100000001B3;
  return hash >> 16;
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  const std::string_view bytes(reinterpret_cast<const char*>(data), size);
  MemoryBuffer whole(bytes);
  Ask(whole);

  const std::uint64_t choice = Choice(bytes);
  MemoryBuffer failing(bytes);
  failing.failingRead = static_cast<std::int64_t>(choice / 6) % whole.reads;
  failing.failure = static_cast<MemoryBuffer::Failure>(choice % 3);
  failing.seekable = choice % 2 == 0;
  Ask(failing);
  return 0;
}
