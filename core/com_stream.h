// A standard stream over a COM stream, for files that the shell hands over as an IStream.
//
// Every property-store handler owns one, so that the readers need not know where their bytes come from. The
// COM stream is never repositioned: a reader takes the bytes in the order in which they arrive, and a seek
// fails as on any stream without positions. Only one thread at a time may use the stream.
#pragma once

#include <objidl.h>

#include <algorithm>
#include <cstddef>
#include <iostream>
#include <memory>
#include <new>
#include <streambuf>
#include <vector>

/// A stream buffer that owns one reference to the attached COM stream. Without a COM stream, or before
/// Allocate, reading hits the end of the stream and writing fails. Failures of the COM stream never throw:
/// they end the input or fail the output.
///
/// One array serves both directions. The get area follows a reserve of four characters, which keeps the last
/// characters read across a refill. The put area begins at the first character and leaves the last one free
/// for the character that is passed to overflow. Input and output must therefore not be mixed.
template <class Char, class Traits = std::char_traits<Char>, class Allocator = std::allocator<Char>>
class basic_combuf : public std::basic_streambuf<Char, Traits> {
  static_assert(sizeof(Char) == 1, "a COM stream counts bytes");

 public:
  using typename std::basic_streambuf<Char, Traits>::int_type;

  basic_combuf() = default;

  /// Writes the pending characters.
  ~basic_combuf() override { Flush(); }

  /// Gives the buffer room for `size` characters and drops characters that were read ahead or are pending.
  /// Reading needs more room than the put-back reserve. If there is no memory, the buffer stays empty.
  void Allocate(std::size_t size) {
    try {
      buffer_.assign(size, Char());
    } catch (const std::bad_alloc&) {
      buffer_ = {};
    }
    ResetAreas();
  }

  /// Attaches `stream` (null for none), which is read from its current position. Clears the recorded result
  /// and drops characters that were read ahead or are pending.
  void Attach(IStream* stream) {
    if (stream != stream_.get()) {
      if (stream != nullptr) stream->AddRef();
      stream_.reset(stream);
    }
    result_ = S_OK;
    ResetAreas();
  }

  /// Returns the COM stream's first failure. Without a failure, returns its last result for a call that read
  /// nothing or wrote too little: S_OK or another success such as S_FALSE.
  HRESULT result() const { return result_; }

 protected:
  int_type overflow(int_type c = Traits::eof()) override {
    if (!Traits::eq_int_type(c, Traits::eof())) {
      // The last character of the array is free, unless an earlier overflow stored a character and could not
      // write it.
      if (!HasRoom() && !(Flush() && HasRoom())) return Traits::eof();
      *this->pptr() = Traits::to_char_type(c);
      MovePutPosition(this->pptr() + 1);
    }
    return Flush() ? c : Traits::eof();
  }

  int_type underflow() override {
    if (stream_ == nullptr) return Traits::eof();
    if (this->gptr() < this->egptr()) return Traits::to_int_type(*this->gptr());
    if (buffer_.size() <= kPutBack) return Traits::eof();

    Char* const first = Begin() + kPutBack;
    const auto kept = std::min(std::ptrdiff_t{kPutBack}, this->gptr() - this->eback());
    Traits::move(first - kept, this->gptr() - kept, static_cast<std::size_t>(kept));
    // Even a failing Read may write to its buffer, so only the reserve can be put back now.
    this->setg(first - kept, first, first);

    const auto wanted = static_cast<ULONG>(buffer_.size() - kPutBack);
    ULONG read = 0;
    const HRESULT result = stream_->Read(first, wanted, &read);
    if (FAILED(result) || read == 0) {
      Record(result);
      return Traits::eof();
    }
    // A faulty stream may report more than it was able to write. The get area must not extend past the
    // buffer.
    this->setg(first - kept, first, first + std::min(read, wanted));
    return Traits::to_int_type(*first);
  }

  int sync() override { return Flush() ? 0 : -1; }

 private:
  struct Releaser {
    void operator()(IStream* stream) const { stream->Release(); }
  };

  static constexpr std::size_t kPutBack = 4;

  Char* Begin() { return buffer_.data(); }
  Char* End() { return buffer_.data() + buffer_.size(); }
  bool HasRoom() { return this->pptr() != End(); }

  void ResetAreas() {
    Char* const first = buffer_.size() < kPutBack ? End() : Begin() + kPutBack;
    this->setg(first, first, first);
    MovePutPosition(Begin());
  }

  /// Ends the put area before the last character, but never before `position`: the base class relies on that.
  void MovePutPosition(Char* position) {
    this->setp(Begin(), buffer_.empty() ? End() : std::max(End() - 1, position));
    this->pbump(static_cast<int>(position - Begin()));
  }

  /// Writes the pending characters; returns whether the COM stream took them all. A stream that is only read
  /// never gets a Write call, not even for zero bytes.
  bool Flush() {
    if (stream_ == nullptr) return false;
    const auto pending = static_cast<ULONG>(this->pptr() - this->pbase());
    if (pending == 0) return true;
    ULONG written = 0;
    const HRESULT result = stream_->Write(Begin(), pending, &written);
    if (SUCCEEDED(result) && written == pending) {
      MovePutPosition(Begin());
      return true;
    }
    Record(result);
    return false;
  }

  void Record(HRESULT result) {
    if (!FAILED(result_)) result_ = result;
  }

  std::unique_ptr<IStream, Releaser> stream_;
  std::vector<Char, Allocator> buffer_;
  HRESULT result_ = S_OK;
};

/// A stream that owns its stream buffer. It starts without a COM stream and without memory; its owner
/// provides both through the buffer.
template <class Char, class Traits = std::char_traits<Char>>
class basic_comstream : public std::basic_iostream<Char, Traits> {
 public:
  basic_comstream() : std::basic_iostream<Char, Traits>(nullptr) {
    std::basic_ios<Char, Traits>::rdbuf(&buffer_);
  }

  basic_combuf<Char, Traits>* rdbuf() { return &buffer_; }

 private:
  basic_combuf<Char, Traits> buffer_;
};
