// A file in memory that counts its reads and can make one of them fail.
#pragma once

#include <algorithm>
#include <cstdint>
#include <stdexcept>
#include <streambuf>
#include <string_view>

namespace Qel::Lumetra::ShellExt::Testing {

/// Reads without buffering: every read of the stream is one read of the file. Like a file, it can be
/// positioned after its end.
class MemoryBuffer : public std::streambuf {
 public:
  /// What the failing read does. Later reads succeed again.
  enum class Failure { kReturnsNothing, kReturnsHalf, kThrows };

  /// `bytes` must outlive the buffer.
  explicit MemoryBuffer(std::string_view bytes) : bytes_(bytes) {}

  std::int64_t failingRead = -1;  // its index, from 0; -1 for none
  Failure failure = Failure::kReturnsNothing;
  bool seekable = true;
  std::int64_t trailingZeros = 0;  // the zero bytes that follow the file's own, as in a sparse file
  std::string_view tail = {};      // the bytes that follow these zeros

  std::int64_t reads = 0;
  std::int64_t bytesRead = 0;
  std::int64_t largestRead = 0;
  std::int64_t readsBackward = 0;  // the reads that begin before the end of the previous read

 protected:
  std::streamsize xsgetn(char* target, std::streamsize count) override {
    if (count == 0) return 0;  // not a read of the file
    const auto stored = static_cast<std::streamsize>(bytes_.size());
    const std::streamsize tailPosition = stored + trailingZeros;
    std::streamsize got = std::clamp<std::streamsize>(Size() - position_, 0, count);
    if (reads++ == failingRead) {
      if (failure == Failure::kThrows) throw std::runtime_error("the medium is gone");
      got = failure == Failure::kReturnsHalf ? got / 2 : 0;
    }
    if (position_ < endOfLastRead_) ++readsBackward;
    endOfLastRead_ = position_ + got;
    const std::streamsize copied = std::clamp<std::streamsize>(stored - position_, 0, got);
    std::copy_n(bytes_.begin() + std::min(position_, stored), copied, target);
    std::fill(target + copied, target + got, '\0');
    if (const std::streamsize before = std::max<std::streamsize>(tailPosition - position_, 0); before < got) {
      std::copy_n(tail.begin() + (position_ + before - tailPosition), got - before, target + before);
    }
    position_ += got;
    bytesRead += got;
    largestRead = std::max<std::int64_t>(largestRead, got);
    return got;
  }

  int_type uflow() override {
    char byte = 0;
    return xsgetn(&byte, 1) == 1 ? traits_type::to_int_type(byte) : traits_type::eof();
  }

  int_type underflow() override {
    const int_type byte = uflow();
    if (!traits_type::eq_int_type(byte, traits_type::eof())) --position_;
    return byte;
  }

  pos_type seekoff(off_type offset, std::ios_base::seekdir direction, std::ios_base::openmode) override {
    off_type base = 0;
    if (direction == std::ios_base::end) base = Size();
    if (direction == std::ios_base::cur) base = position_;
    return seekpos(base + offset, std::ios_base::in);
  }

  pos_type seekpos(pos_type position, std::ios_base::openmode) override {
    if (!seekable || off_type{position} < 0) return {off_type{-1}};
    position_ = position;
    return position;
  }

 private:
  std::streamoff Size() const {
    return static_cast<std::streamoff>(bytes_.size() + tail.size()) + trailingZeros;
  }

  std::string_view bytes_;
  std::streamoff position_ = 0;
  std::streamoff endOfLastRead_ = 0;
};

}  // namespace Qel::Lumetra::ShellExt::Testing
