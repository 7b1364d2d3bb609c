#include "com_stream.h"

#include <gtest/gtest.h>

#include <string>

#include "scripted_stream.h"

namespace {

using Qel::Lumetra::ShellExt::Testing::ScriptedStream;
using Buffer = basic_combuf<char>;
using Stream = basic_comstream<char>;

constexpr int kEnd = std::char_traits<char>::eof();
constexpr HRESULT kReadFault = STG_E_READFAULT;
constexpr HRESULT kAccessDenied = STG_E_ACCESSDENIED;

/// Returns `count` bytes of a pattern that repeats after 251 bytes, so that no two buffers hold the same.
std::string Bytes(std::size_t count) {
  std::string bytes;
  for (std::size_t i = 0; i < count; ++i) bytes += static_cast<char>(i % 251);
  return bytes;
}

/// Reads `buffer` to its end, one character at a time.
std::string ReadAll(Buffer& buffer) {
  std::string all;
  for (int c = buffer.sbumpc(); c != kEnd; c = buffer.sbumpc()) all += static_cast<char>(c);
  return all;
}

/// A buffer of `size` characters, attached to `stream`.
struct OpenBuffer : Buffer {
  OpenBuffer(ScriptedStream& stream, std::size_t size) {
    Allocate(size);
    Attach(&stream);
  }
};

TEST(ComBufferReading, ReturnsTheBytesInOrderForEveryBufferAndPieceSize) {
  const std::string bytes = Bytes(300);
  for (const std::size_t size : {5u, 6u, 8u, 9u, 64u, 303u, 304u, 305u, 5000u}) {
    for (const ULONG piece : {1u, 2u, 3u, 7u, 299u, 1000u}) {
      ScriptedStream source(bytes);
      source.maxPerRead = piece;
      OpenBuffer buffer(source, size);
      EXPECT_EQ(ReadAll(buffer), bytes) << "buffer of " << size << ", pieces of " << piece;
      EXPECT_EQ(source.otherCalls, 0);
    }
  }
}

TEST(ComBufferReading, RequestsTheBufferSizeLessTheReserve) {
  ScriptedStream source(Bytes(100));
  OpenBuffer buffer(source, 64);
  EXPECT_EQ(buffer.sgetc(), 0);
  EXPECT_EQ(source.wanted, std::vector<ULONG>{60});
}

TEST(ComBufferReading, DoesNotReadWhileCharactersAreLeft) {
  ScriptedStream source(Bytes(8));
  OpenBuffer buffer(source, 8);
  for (int i = 0; i < 3; ++i) {
    EXPECT_EQ(buffer.sgetc(), 0);
    EXPECT_EQ(source.reads, 1);
  }
}

TEST(ComBufferReading, ReturnsBytesFrom128UpAsPositiveCharacters) {
  ScriptedStream source("\xFF\x80");
  OpenBuffer buffer(source, 16);
  EXPECT_EQ(buffer.sbumpc(), 0xFF);
  EXPECT_EQ(buffer.sbumpc(), 0x80);
  EXPECT_EQ(buffer.sbumpc(), kEnd);
}

TEST(ComBufferReading, AcceptsBytesReturnedWithSFalse) {
  ScriptedStream source(Bytes(10));
  source.readResult = S_FALSE;
  OpenBuffer buffer(source, 64);
  EXPECT_EQ(ReadAll(buffer), Bytes(10));
}

TEST(ComBufferReading, NeverReadsPastTheBufferWhenAStreamClaimsMoreThanWasRequested) {
  const std::string bytes = Bytes(30);
  ScriptedStream source(bytes);
  source.overclaim = 1000;
  OpenBuffer buffer(source, 14);
  // The buffer has room for ten bytes. Each of the three Reads claims more.
  EXPECT_EQ(ReadAll(buffer), bytes);
}

TEST(ComBufferReading, IsAtItsEndWithoutAStream) {
  Buffer buffer;
  EXPECT_EQ(buffer.sgetc(), kEnd);
  buffer.Allocate(64);
  EXPECT_EQ(buffer.sgetc(), kEnd);
  buffer.Attach(nullptr);
  EXPECT_EQ(buffer.sgetc(), kEnd);
  EXPECT_EQ(buffer.result(), S_OK);
}

TEST(ComBufferReading, IsAtItsEndWithoutABufferLargerThanTheReserve) {
  for (const std::size_t size : {0u, 1u, 3u, 4u}) {
    ScriptedStream source(Bytes(10));
    OpenBuffer buffer(source, size);
    EXPECT_EQ(buffer.sgetc(), kEnd) << size;
    EXPECT_EQ(source.reads, 0);
  }
}

TEST(ComBufferReading, KeepsTheBytesBeforeAReadThatFails) {
  const std::string bytes = Bytes(40);
  for (int failing = 1; failing <= 11; ++failing) {
    ScriptedStream source(bytes);
    source.maxPerRead = 4;
    source.failingRead = failing;
    OpenBuffer buffer(source, 12);
    EXPECT_EQ(ReadAll(buffer), bytes.substr(0, static_cast<std::size_t>(failing - 1) * 4));
    EXPECT_EQ(buffer.result(), kReadFault);
  }
}

TEST(ComBufferReading, ContinuesAfterATemporaryFailure) {
  ScriptedStream source(Bytes(8));
  source.maxPerRead = 4;
  source.failingRead = 2;
  OpenBuffer buffer(source, 12);
  EXPECT_EQ(ReadAll(buffer), Bytes(4));
  EXPECT_EQ(ReadAll(buffer), Bytes(8).substr(4));
}

TEST(ComBufferPutBack, KeepsFourCharactersAcrossARefill) {
  const std::string bytes = Bytes(40);
  for (std::size_t consumed = 1; consumed < 40; ++consumed) {
    ScriptedStream source(bytes);
    OpenBuffer buffer(source, 12);
    for (std::size_t i = 0; i < consumed; ++i) ASSERT_EQ(buffer.sbumpc(), bytes[i]);
    buffer.sgetc();  // refills the buffer if it is empty
    const std::size_t back = std::min<std::size_t>(consumed, 4);
    for (std::size_t i = 1; i <= back; ++i) EXPECT_EQ(buffer.sungetc(), bytes[consumed - i]) << consumed;
    EXPECT_EQ(ReadAll(buffer), bytes.substr(consumed - back)) << consumed;
  }
}

TEST(ComBufferPutBack, KeepsNoMoreThanTheReserve) {
  ScriptedStream source(Bytes(40));
  OpenBuffer buffer(source, 12);
  for (int i = 0; i < 8; ++i) buffer.sbumpc();
  EXPECT_EQ(buffer.sgetc(), 8);
  for (int i = 7; i >= 4; --i) EXPECT_EQ(buffer.sungetc(), i);
  EXPECT_EQ(buffer.sungetc(), kEnd);
}

TEST(ComBufferPutBack, KeepsNoMoreThanTheReserveAtTheEnd) {
  ScriptedStream source(Bytes(8));
  OpenBuffer buffer(source, 12);
  EXPECT_EQ(ReadAll(buffer), Bytes(8));
  EXPECT_EQ(buffer.result(), S_OK);
  for (int i = 7; i >= 4; --i) EXPECT_EQ(buffer.sungetc(), i);
  EXPECT_EQ(buffer.sungetc(), kEnd);
  EXPECT_EQ(ReadAll(buffer), Bytes(8).substr(4));
}

TEST(ComBufferPutBack, KeepsNoMoreThanWasConsumedAtTheEnd) {
  ScriptedStream source(Bytes(2));
  OpenBuffer buffer(source, 12);
  EXPECT_EQ(ReadAll(buffer), Bytes(2));
  for (int i = 1; i >= 0; --i) EXPECT_EQ(buffer.sungetc(), i);
  EXPECT_EQ(buffer.sungetc(), kEnd);
}

TEST(ComBufferPutBack, HasNothingBeforeTheFirstCharacter) {
  ScriptedStream source(Bytes(4));
  OpenBuffer buffer(source, 12);
  EXPECT_EQ(buffer.sungetc(), kEnd);
  EXPECT_EQ(buffer.sgetc(), 0);
  EXPECT_EQ(buffer.sungetc(), kEnd);
}

TEST(ComBufferPutBack, GathersTheReserveFromPiecesOfOneByte) {
  const std::string bytes = Bytes(9);
  ScriptedStream source(bytes);
  source.maxPerRead = 1;
  OpenBuffer buffer(source, 12);
  for (int i = 0; i < 6; ++i) buffer.sbumpc();
  for (int i = 5; i >= 2; --i) EXPECT_EQ(buffer.sungetc(), i);
  EXPECT_EQ(ReadAll(buffer), bytes.substr(2));
}

TEST(ComBufferPutBack, SurvivesAFailureThatSpoilsTheBuffer) {
  ScriptedStream source(Bytes(8));
  source.failingRead = 2;
  OpenBuffer buffer(source, 12);
  EXPECT_EQ(ReadAll(buffer), Bytes(8));
  for (int i = 7; i >= 4; --i) EXPECT_EQ(buffer.sungetc(), i);
}

TEST(ComBufferResult, IsSFalseIfReadReturnsItAtTheEnd) {
  ScriptedStream source("");
  source.endResult = S_FALSE;
  OpenBuffer buffer(source, 16);
  EXPECT_EQ(buffer.result(), S_OK);
  EXPECT_EQ(buffer.sgetc(), kEnd);
  EXPECT_EQ(buffer.result(), S_FALSE);
}

TEST(ComBufferResult, IsReplacedUnlessItIsAFailure) {
  ScriptedStream source("");
  source.endResult = S_FALSE;
  OpenBuffer buffer(source, 16);
  buffer.sgetc();
  source.endResult = S_OK;
  buffer.sgetc();
  EXPECT_EQ(buffer.result(), S_OK);
  source.endResult = S_FALSE;
  buffer.sgetc();
  EXPECT_EQ(buffer.result(), S_FALSE);
  source.failingRead = source.reads + 1;
  buffer.sgetc();
  EXPECT_EQ(buffer.result(), kReadFault);
}

TEST(ComBufferResult, IsReplacedByAFailingWrite) {
  ScriptedStream source("");
  source.endResult = S_FALSE;
  source.writeResult = kAccessDenied;
  OpenBuffer buffer(source, 16);
  buffer.sgetc();
  EXPECT_EQ(buffer.result(), S_FALSE);
  buffer.sputc('a');
  EXPECT_EQ(buffer.pubsync(), -1);
  EXPECT_EQ(buffer.result(), kAccessDenied);
}

TEST(ComBufferResult, KeepsTheFirstFailure) {
  ScriptedStream source("");
  source.failingRead = 1;
  source.writeResult = kAccessDenied;
  OpenBuffer buffer(source, 16);
  buffer.sgetc();
  EXPECT_EQ(buffer.result(), kReadFault);
  source.failingRead = 2;
  source.readFailure = E_FAIL;
  buffer.sgetc();
  buffer.sputc('a');
  buffer.pubsync();
  source.endResult = S_FALSE;
  buffer.sgetc();
  EXPECT_EQ(buffer.result(), kReadFault);
}

TEST(ComBufferResult, IsResetByEveryAttachmentEvenOfTheSameStream) {
  ScriptedStream source("");
  source.failingRead = 1;
  OpenBuffer buffer(source, 16);
  buffer.sgetc();
  EXPECT_EQ(buffer.result(), kReadFault);
  buffer.Attach(&source);
  EXPECT_EQ(buffer.result(), S_OK);
}

TEST(ComBufferResult, IgnoresReadsThatReturnBytes) {
  ScriptedStream source(Bytes(4));
  source.readResult = S_FALSE;
  OpenBuffer buffer(source, 16);
  buffer.sgetc();
  EXPECT_EQ(buffer.result(), S_OK);
}

TEST(ComBufferWriting, WritesWholeBuffersAndTheRestOnSync) {
  ScriptedStream sink("");
  OpenBuffer buffer(sink, 8);
  const std::string bytes = Bytes(20);
  for (const char c : bytes) EXPECT_EQ(buffer.sputc(c), std::char_traits<char>::to_int_type(c));
  EXPECT_EQ(sink.written, bytes.substr(0, 16));
  EXPECT_EQ(sink.writes, 2);
  EXPECT_EQ(buffer.pubsync(), 0);
  EXPECT_EQ(sink.written, bytes);
}

TEST(ComBufferWriting, WritesBlocksOfAnySizeInOrder) {
  for (const std::size_t size : {1u, 2u, 5u, 8u, 64u}) {
    ScriptedStream sink("");
    {
      OpenBuffer buffer(sink, size);
      const std::string bytes = Bytes(90);
      EXPECT_EQ(buffer.sputn(bytes.data(), 50), 50) << size;
      EXPECT_EQ(buffer.sputn(bytes.data() + 50, 40), 40) << size;
    }
    EXPECT_EQ(sink.written, Bytes(90)) << size;
  }
}

TEST(ComBufferWriting, WritesWhatIsPendingWhenItIsDestroyed) {
  ScriptedStream sink("");
  {
    OpenBuffer buffer(sink, 8);
    buffer.sputc('x');
    EXPECT_EQ(sink.writes, 0);
  }
  EXPECT_EQ(sink.written, "x");
  EXPECT_EQ(sink.references, 1u);
}

TEST(ComBufferWriting, NeverCallsWriteOnAStreamThatIsOnlyRead) {
  ScriptedStream source(Bytes(4));
  {
    OpenBuffer buffer(source, 8);
    ReadAll(buffer);
    EXPECT_EQ(buffer.pubsync(), 0);
  }
  EXPECT_EQ(source.writes, 0);
}

TEST(ComBufferWriting, OverflowWithoutACharacterOnlyWritesWhatIsPending) {
  struct ExposedBuffer : OpenBuffer {
    using OpenBuffer::OpenBuffer;
    using OpenBuffer::overflow;
  };
  ScriptedStream sink("");
  ExposedBuffer buffer(sink, 8);
  EXPECT_EQ(buffer.overflow(), kEnd);
  EXPECT_EQ(sink.writes, 0);
  buffer.sputn("ab", 2);
  sink.writeResult = kAccessDenied;
  EXPECT_EQ(buffer.overflow(kEnd), kEnd);
  EXPECT_EQ(buffer.result(), kAccessDenied);
  sink.writeResult = S_OK;
  EXPECT_EQ(buffer.overflow(kEnd), kEnd);
  EXPECT_EQ(sink.written, "ab");
  EXPECT_EQ(buffer.pubsync(), 0);
  EXPECT_EQ(sink.written, "ab");
  EXPECT_EQ(sink.writes, 2);
}

TEST(ComBufferWriting, FailsWithoutAStream) {
  Buffer buffer;
  EXPECT_EQ(buffer.sputc('a'), kEnd);
  EXPECT_EQ(buffer.pubsync(), -1);
  buffer.Allocate(2);
  EXPECT_EQ(buffer.sputc('a'), 'a');
  EXPECT_EQ(buffer.sputc('b'), kEnd);
  EXPECT_EQ(buffer.sputc('c'), kEnd);
  EXPECT_EQ(buffer.sputn("defg", 4), 0);
  EXPECT_EQ(buffer.pubsync(), -1);
}

TEST(ComBufferWriting, FailsWithoutABuffer) {
  ScriptedStream sink("");
  OpenBuffer buffer(sink, 0);
  EXPECT_EQ(buffer.sputc('a'), kEnd);
  EXPECT_EQ(buffer.sputn("abc", 3), 0);
  EXPECT_EQ(buffer.pubsync(), 0);
  EXPECT_EQ(sink.writes, 0);
}

TEST(ComBufferWriting, TreatsAShortWriteAsAFailure) {
  ScriptedStream sink("");
  sink.maxPerWrite = 2;
  OpenBuffer buffer(sink, 8);
  buffer.sputn("abc", 3);
  EXPECT_EQ(buffer.pubsync(), -1);
  EXPECT_EQ(buffer.result(), S_OK);
}

TEST(ComBufferWriting, StaysInsideItsBufferWhenTheStreamKeepsFailing) {
  ScriptedStream sink("");
  sink.writeResult = kAccessDenied;
  OpenBuffer buffer(sink, 8);
  const std::string bytes = Bytes(100);
  // The buffer holds seven characters. The eighth is stored too but cannot be written, and no more fit.
  EXPECT_EQ(buffer.sputn(bytes.data(), 100), 7);
  EXPECT_EQ(buffer.sputn(bytes.data(), 100), 0);
  for (int i = 0; i < 10; ++i) EXPECT_EQ(buffer.sputc('z'), kEnd);
  sink.writeResult = S_OK;
  EXPECT_EQ(buffer.pubsync(), 0);
  EXPECT_EQ(sink.written, bytes.substr(0, 8));
}

TEST(ComBufferWriting, ResumesAsSoonAsTheStreamAcceptsBytesAgain) {
  ScriptedStream sink("");
  sink.writeResult = kAccessDenied;
  OpenBuffer buffer(sink, 4);
  buffer.sputn("abcd", 4);
  EXPECT_EQ(buffer.sputc('e'), kEnd);
  sink.writeResult = S_OK;
  EXPECT_EQ(buffer.sputc('e'), 'e');
  EXPECT_EQ(sink.written, "abcde");
}

TEST(ComBufferAttaching, HoldsOneReferenceAtATime) {
  ScriptedStream first("");
  ScriptedStream second("");
  {
    OpenBuffer buffer(first, 16);
    EXPECT_EQ(first.references, 2u);
    buffer.Attach(&first);
    EXPECT_EQ(first.references, 2u);
    buffer.Attach(&second);
    EXPECT_EQ(first.references, 1u);
    EXPECT_EQ(second.references, 2u);
    buffer.Attach(nullptr);
    EXPECT_EQ(second.references, 1u);
    buffer.Attach(&second);
  }
  EXPECT_EQ(second.references, 1u);
}

TEST(ComBufferAttaching, DropsBytesReadAheadAndPendingBytes) {
  ScriptedStream source(Bytes(20));
  OpenBuffer buffer(source, 12);
  EXPECT_EQ(buffer.sbumpc(), 0);
  buffer.Attach(&source);
  EXPECT_EQ(buffer.sungetc(), kEnd);
  EXPECT_EQ(buffer.sbumpc(), 8);

  buffer.Attach(&source);
  buffer.sputc('a');
  buffer.Attach(&source);
  EXPECT_EQ(buffer.pubsync(), 0);
  EXPECT_EQ(source.writes, 0);
}

TEST(ComStream, IsGoodAndEmptyAtFirst) {
  Stream stream;
  EXPECT_TRUE(stream.good());
  EXPECT_EQ(stream.get(), kEnd);
  EXPECT_TRUE(stream.eof());
  EXPECT_TRUE(stream.fail());
  EXPECT_FALSE(stream.bad());
}

TEST(ComStream, ReadsAcrossRefillsAndUngetsFour) {
  const std::string bytes = Bytes(100);
  ScriptedStream source(bytes);
  Stream stream;
  stream.rdbuf()->Allocate(16);
  stream.rdbuf()->Attach(&source);
  std::string read(50, '\0');
  stream.read(read.data(), 50);
  EXPECT_EQ(read, bytes.substr(0, 50));
  for (int i = 0; i < 4; ++i) EXPECT_TRUE(stream.unget());
  stream.read(read.data(), 50);
  EXPECT_EQ(read, bytes.substr(46, 50));
  EXPECT_TRUE(stream.good());
}

TEST(ComStream, FailsToSeekAndContinuesReadingAfterwards) {
  const std::string bytes = Bytes(100);
  ScriptedStream source(bytes);
  Stream stream;
  stream.rdbuf()->Allocate(16);
  stream.rdbuf()->Attach(&source);
  EXPECT_EQ(stream.tellg(), std::streampos(-1));
  EXPECT_EQ(stream.get(), 0);
  stream.seekg(0);
  EXPECT_TRUE(stream.fail());
  EXPECT_FALSE(stream.bad());
  stream.clear();
  stream.seekg(0, std::ios_base::end);
  EXPECT_TRUE(stream.fail());
  stream.clear();
  EXPECT_EQ(stream.get(), 1);
  EXPECT_EQ(source.otherCalls, 0);
}

TEST(ComStream, EndsWhereTheStreamFails) {
  ScriptedStream source(Bytes(100));
  source.maxPerRead = 10;
  source.failingRead = 3;
  Stream stream;
  stream.rdbuf()->Allocate(64);
  stream.rdbuf()->Attach(&source);
  std::string read(50, '\0');
  stream.read(read.data(), 50);
  EXPECT_EQ(stream.gcount(), 20);
  EXPECT_FALSE(stream.good());
  EXPECT_EQ(stream.rdbuf()->result(), kReadFault);
}

TEST(ComStream, Writes) {
  ScriptedStream sink("");
  {
    Stream stream;
    stream.rdbuf()->Allocate(16);
    stream.rdbuf()->Attach(&sink);
    stream << "one " << 2 << std::flush;
    EXPECT_EQ(sink.written, "one 2");
    stream << " three";
  }
  EXPECT_EQ(sink.written, "one 2 three");
  EXPECT_EQ(sink.references, 1u);
}

}  // namespace
