// The fuzzer of a file kind, built once for each kind. The input is the file. Its last bytes also determine
// the request, so that each input makes only one thumbnail and its findings can be reproduced.
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <istream>
#include <string_view>

#include "ask_everything.h"
#include "memory_buffer.h"

namespace {

using namespace Qel::Lumetra::ShellExt::Testing;

/// The request and the failures that an input determines.
struct Choice {
  SIZE request{1, 1};
  std::int64_t failingRead = -1;  // number of the read that fails, from 0; -1 for none
  MemoryBuffer::Failure failure = MemoryBuffer::Failure::kReturnsNothing;
  bool seekable = true;
};

Choice ChoiceOf(std::string_view bytes) {
  if (bytes.size() < 4) return {};
  const auto byte = [end = bytes.rbegin()](int i) { return static_cast<unsigned char>(end[i]); };
  // The edges range from -16, which is invalid, to more than the edge of most frames. A read fails for half
  // of the inputs.
  return {{byte(0) - 16, byte(1) - 16},
          byte(2) % 2 == 1 ? byte(2) / 2 : -1,
          static_cast<MemoryBuffer::Failure>(byte(3) % 3),
          byte(3) < 0x80};
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  const std::string_view bytes(reinterpret_cast<const char*>(data), size);
  const Choice choice = ChoiceOf(bytes);
  MemoryBuffer buffer(bytes);
  buffer.failingRead = choice.failingRead;
  buffer.failure = choice.failure;
  buffer.seekable = choice.seekable;
  std::istream stream(&buffer);
  const Answers answers = AskEverything(stream, QEL_FILE_KIND, {&choice.request, 1});
  if (answers.wrong.empty()) return 0;
  std::fprintf(stderr, "%s\n", answers.wrong.c_str());
  std::abort();
}
