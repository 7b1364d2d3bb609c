// The fuzzer of basic_combuf. The input determines the size of the buffer, the bytes and failures of the COM
// stream, and the operations on the buffer. The fuzzer compares the bytes that it reads with those of the
// stream.
#include <fuzzer/FuzzedDataProvider.h>

#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <string>

#include "com_stream.h"
#include "scripted_stream.h"

namespace {

using Qel::Lumetra::ShellExt::Testing::ScriptedStream;
using Traits = std::char_traits<char>;

constexpr HRESULT kResults[] = {S_OK, S_FALSE, E_FAIL, STG_E_READFAULT, STG_E_ACCESSDENIED};
constexpr std::size_t kMaxBytes = 3000;

void Require(bool condition, const char* what) {
  if (condition) return;
  std::fprintf(stderr, "%s\n", what);
  std::abort();
}

/// Reads from a buffer and aborts if the bytes are not the next ones of the stream.
class Reader {
 public:
  Reader(basic_combuf<char>& buffer, ScriptedStream& stream) : buffer_(buffer), stream_(stream) {}

  void Next() { Expect(buffer_.sbumpc(), 1); }
  void Peek() { Expect(buffer_.sgetc(), 0); }

  void PutBack() {
    if (!Traits::eq_int_type(buffer_.sungetc(), Traits::eof())) --position_;
  }

  void Read(std::size_t count) {
    std::string bytes(count, '\0');
    bytes.resize(static_cast<std::size_t>(buffer_.sgetn(bytes.data(), static_cast<std::streamsize>(count))));
    Require(bytes == stream_.content.substr(position_, bytes.size()),
            "the bytes read differ from the stream's");
    position_ += bytes.size();
  }

  /// Expects the stream's position next, because the buffer has dropped what it had read ahead.
  void Restart() { position_ = stream_.position; }

 private:
  void Expect(Traits::int_type got, std::size_t step) {
    if (Traits::eq_int_type(got, Traits::eof())) return;
    Require(position_ < stream_.content.size(), "a byte after the end of the stream was read");
    Require(Traits::to_char_type(got) == stream_.content[position_],
            "the byte read differs from the stream's");
    position_ += step;
  }

  basic_combuf<char>& buffer_;
  ScriptedStream& stream_;
  std::size_t position_ = 0;
};

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  FuzzedDataProvider input(data, size);
  ScriptedStream stream(input.ConsumeRandomLengthString(kMaxBytes));
  stream.maxPerRead = input.ConsumeIntegralInRange<ULONG>(1, kMaxBytes);
  stream.maxPerWrite = input.ConsumeIntegralInRange<ULONG>(0, kMaxBytes);
  stream.failingRead = input.ConsumeIntegralInRange<int>(0, 20);
  stream.endResult = input.PickValueInArray(kResults);
  stream.writeResult = input.PickValueInArray(kResults);
  // If the stream reports more bytes than it delivers, the bytes cannot be compared.
  const bool honest = input.ConsumeBool();
  if (!honest) stream.overclaim = input.ConsumeIntegral<ULONG>();
  {
    basic_combuf<char> buffer;
    buffer.Allocate(input.ConsumeIntegralInRange<std::size_t>(0, kMaxBytes));
    buffer.Attach(&stream);
    Reader reader(buffer, stream);
    // Reading and writing share the buffer's memory, so the bytes are only compared if nothing is written.
    const bool writes = input.ConsumeBool();
    while (input.remaining_bytes() > 0) {
      const bool compares = honest && !writes;
      switch (input.ConsumeIntegralInRange(0, writes ? 11 : 6)) {
        case 0: compares ? reader.Next() : void(buffer.sbumpc()); break;
        case 1: compares ? reader.Peek() : void(buffer.sgetc()); break;
        case 2: compares ? reader.PutBack() : void(buffer.sungetc()); break;
        case 3: {
          const auto count = input.ConsumeIntegralInRange<std::size_t>(0, kMaxBytes);
          std::string bytes(count, '\0');
          compares ? reader.Read(count) : void(buffer.sgetn(bytes.data(), std::streamsize(count)));
          break;
        }
        case 4:
          Require(buffer.pubseekoff(input.ConsumeIntegral<int>(), std::ios_base::cur) ==
                      std::streampos(std::streamoff(-1)),
                  "a COM stream was repositioned");
          break;
        case 5:
          buffer.Attach(&stream);
          reader.Restart();
          break;
        case 6:
          buffer.Allocate(input.ConsumeIntegralInRange<std::size_t>(0, kMaxBytes));
          reader.Restart();
          break;
        case 7: buffer.sputbackc(input.ConsumeIntegral<char>()); break;
        case 8: buffer.sputc(input.ConsumeIntegral<char>()); break;
        case 9: {
          const std::string bytes = input.ConsumeRandomLengthString(kMaxBytes);
          buffer.sputn(bytes.data(), static_cast<std::streamsize>(bytes.size()));
          break;
        }
        case 10: buffer.pubsync(); break;
        case 11: buffer.Attach(nullptr); break;
      }
    }
  }
  Require(stream.references == 1, "a reference to the COM stream was leaked or released too often");
  return 0;
}
