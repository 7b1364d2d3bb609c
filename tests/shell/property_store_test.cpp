// Tests the property-store handlers.
#include <gtest/gtest.h>
#include <windows.h>

#include <propsys.h>
#include <shlobj.h>

#include <atomic>
#include <cstring>
#include <functional>
#include <string>
#include <thread>
#include <vector>

#include "ebn_file.h"
#include "mrc_file.h"
#include "raw_file.h"
#include "scripted_stream.h"
#include "server_dll.h"
#include "shell_values.h"

namespace Qel::Lumetra::ShellExt::Testing {
namespace {

/// Returns a file with one label, and with pixels that a buffer for the header cannot hold.
std::string MrcBytes(std::int32_t nx = 512, std::int32_t ny = 256, std::int32_t nz = 1,
                     std::int32_t mode = 0) {
  const MrcFile file{
      .nx = nx, .ny = ny, .nz = nz, .mode = mode, .labels = {"a label"}, .pixels = std::string(200'000, 'p')};
  return file.Bytes();
}

std::string EbnBytes() {
  return EbnFile{
      .typeCode = 2, .width = 300, .height = 200, .model = 1, .afterHeader = std::string(9000, 'p')}
      .Bytes();
}

std::string RawBytes() {
  return PackedRawFile(DataType::kFloat32, 48, 32, std::string(48 * 32 * 4, 'p')).Bytes();
}

class PropertyStore : public ServerTest {
 protected:
  using Handler = ComPtr<IPropertyStore>;

  Handler Make(const CLSID& clsid = kMrcHandlerClass) {
    return dll_.CreateInstance<IPropertyStore>(clsid, IID_IPropertyStore);
  }

  static void Initialize(const Handler& handler, IStream* stream) {
    EXPECT_EQ(As<IInitializeWithStream>(handler, IID_IInitializeWithStream)->Initialize(stream, STGM_READ),
              S_OK);
  }

  Handler Open(ScriptedStream& stream, const CLSID& clsid = kMrcHandlerClass) {
    Handler handler = Make(clsid);
    Initialize(handler, &stream);
    return handler;
  }

  /// Returns the value of `key`, which must exist.
  static Value Read(const Handler& handler, const PROPERTYKEY& key) {
    PROPVARIANT value{};
    EXPECT_EQ(handler->GetValue(key, &value), S_OK);
    return TakeValue(value);
  }

  /// Returns the failure of GetValue. The value must be empty, so that nothing has to be cleared.
  static HRESULT Refusal(const Handler& handler, const PROPERTYKEY& key) {
    PROPVARIANT value{};
    const HRESULT result = handler->GetValue(key, &value);
    EXPECT_EQ(TakeValue(value), Value());
    return result;
  }

  static HRESULT ReadWidth(const Handler& handler) {
    PROPVARIANT value{};
    return handler->GetValue(kWidthKey, &value);
  }
};

TEST_F(PropertyStore, HasItsThreeInterfacesInOrderAndNoOther) {
  const IID interfaces[] = {
      {0xB824B49D,
       0x22AC,
       0x4161,
       {0xAC, 0x8A, 0x99, 0x16, 0xE8, 0xFA, 0x3F, 0x7F}},  // IInitializeWithStream
      {0x886D8EEB, 0x8CF2, 0x4446, {0x8D, 0x02, 0xCD, 0xBA, 0x1D, 0xBD, 0xCF, 0x99}},  // IPropertyStore
      {0xC8E2D566,
       0x186E,
       0x4D49,
       {0xBF, 0x41, 0x69, 0x09, 0xEA, 0xD5, 0x6A, 0xCC}},  // IPropertyStoreCapabilities
  };
  for (const CLSID& clsid : {kMrcHandlerClass, kEbnHandlerClass, kRawHandlerClass}) {
    const auto object = dll_.CreateInstance<IUnknown>(clsid, IID_IUnknown);
    const auto* place = reinterpret_cast<const char*>(object.Get());
    for (const IID& iid : interfaces) {
      const auto answer = As<IUnknown>(object, iid);
      EXPECT_EQ(reinterpret_cast<const char*>(answer.Get()), place);
      EXPECT_EQ(As<IUnknown>(answer, IID_IUnknown).Get(), object.Get());
      place += sizeof(void*);
    }
    for (const IID& iid : {IID_IInitializeWithFile, IID_IPersistFile, IID_IExtractImage, IID_IMarshal}) {
      void* answer = &answer;
      EXPECT_EQ(object->QueryInterface(iid, &answer), E_NOINTERFACE);
      EXPECT_EQ(answer, nullptr);
    }
  }
}

TEST_F(PropertyStore, OfMrcHasTheSixProperties) {
  ScriptedStream stream(MrcBytes(512, 256, 61, 1));
  const Handler handler = Open(stream);
  EXPECT_EQ(Read(handler, kWidthKey), Number(VT_UI4, 512));
  EXPECT_EQ(Read(handler, kHeightKey), Number(VT_UI4, 256));
  EXPECT_EQ(Read(handler, kBitDepthKey), Number(VT_UI4, 16));
  EXPECT_EQ(Read(handler, kFrameCountKey), Number(VT_UI4, 61));
  EXPECT_EQ(Read(handler, kDimensionsKey), Text(VT_LPWSTR, L"(512 x 256) 16 bit signed"));
  EXPECT_EQ(Read(handler, kCommentsKey), Text(VT_LPWSTR, L""));
}

TEST_F(PropertyStore, OfEbnHasTheSixProperties) {
  ScriptedStream stream(EbnBytes());
  const Handler handler = Open(stream, kEbnHandlerClass);
  EXPECT_EQ(Read(handler, kWidthKey), Number(VT_UI4, 300));
  EXPECT_EQ(Read(handler, kHeightKey), Number(VT_UI4, 200));
  EXPECT_EQ(Read(handler, kBitDepthKey), Number(VT_UI4, 16));
  EXPECT_EQ(Read(handler, kFrameCountKey), Number(VT_UI4, 1));
  EXPECT_EQ(Read(handler, kDimensionsKey), Text(VT_LPWSTR, L"(300 x 200) 16 bit unsigned"));
  EXPECT_EQ(Read(handler, kCommentsKey), Text(VT_LPWSTR, L""));
}

TEST_F(PropertyStore, OfRawHasTheSixProperties) {
  ScriptedStream stream(RawBytes());
  const Handler handler = Open(stream, kRawHandlerClass);
  EXPECT_EQ(Read(handler, kWidthKey), Number(VT_UI4, 48));
  EXPECT_EQ(Read(handler, kHeightKey), Number(VT_UI4, 32));
  EXPECT_EQ(Read(handler, kBitDepthKey), Number(VT_UI4, 32));
  EXPECT_EQ(Read(handler, kFrameCountKey), Number(VT_UI4, 1));
  EXPECT_EQ(Read(handler, kDimensionsKey), Text(VT_LPWSTR, L"(48 x 32) 32 bit float"));
  EXPECT_EQ(Read(handler, kCommentsKey), Text(VT_LPWSTR, L""));
}

TEST_F(PropertyStore, GivesANegativeNumberAsAnUnsignedOne) {
  ScriptedStream stream(RawFile{.width = -2}.Bytes());
  const Handler handler = Open(stream, kRawHandlerClass);
  EXPECT_EQ(Read(handler, kWidthKey), Number(VT_UI4, 0xFFFFFFFE));
  EXPECT_EQ(Read(handler, kDimensionsKey), Text(VT_LPWSTR, L"(-2 x 1) 8 bit unsigned"));
}

TEST_F(PropertyStore, WritesSizesWithoutGrouping) {
  ScriptedStream stream(MrcBytes(2048, 1234567, 1, 2));
  EXPECT_EQ(Read(Open(stream), kDimensionsKey), Text(VT_LPWSTR, L"(2048 x 1234567) 32 bit float"));
}

TEST_F(PropertyStore, GivesTheTypeDescriptionAndNotTheCommentAsComment) {
  // Both files have a comment. The type description is empty for every kind.
  ScriptedStream mrc(MrcBytes());
  EXPECT_EQ(Read(Open(mrc), kCommentsKey), Text(VT_LPWSTR, L""));
  ScriptedStream ebn(EbnBytes());
  EXPECT_EQ(Read(Open(ebn, kEbnHandlerClass), kCommentsKey), Text(VT_LPWSTR, L""));
}

TEST_F(PropertyStore, BuildsTheReaderOfItsOwnKindOnly) {
  ScriptedStream ebn(EbnBytes());
  EXPECT_EQ(Refusal(Open(ebn, kRawHandlerClass), kWidthKey), E_FAIL);
  ScriptedStream raw(RawBytes());
  EXPECT_EQ(Refusal(Open(raw, kMrcHandlerClass), kWidthKey), E_FAIL);
}

TEST_F(PropertyStore, CountsNoPropertiesWithTheResultSix) {
  ScriptedStream stream(MrcBytes());
  for (const Handler& handler : {Make(), Open(stream)}) {
    DWORD count = 77;
    EXPECT_EQ(handler->GetCount(&count), HRESULT{6});
    EXPECT_EQ(count, 0u);
  }
}

TEST_F(PropertyStore, ListsSixKeysByIndex) {
  const Handler handler = Make();
  const PROPERTYKEY keys[] = {kWidthKey,      kHeightKey,     kBitDepthKey,
                              kFrameCountKey, kDimensionsKey, kCommentsKey};
  for (DWORD i = 0; i < std::size(keys); ++i) {
    PROPERTYKEY key{kOtherSet, 1};
    EXPECT_EQ(handler->GetAt(i, &key), S_OK);
    EXPECT_TRUE(IsEqualPropertyKey(key, keys[i])) << i;
  }
}

TEST_F(PropertyStore, ListsTheNullKeyAfterTheSix) {
  const Handler handler = Make();
  for (const DWORD index : {DWORD{6}, DWORD{7}, DWORD{0x80000000}, DWORD{0xFFFFFFFF}}) {
    PROPERTYKEY key{kOtherSet, 1};
    EXPECT_EQ(handler->GetAt(index, &key), E_UNEXPECTED);
    EXPECT_TRUE(IsEqualPropertyKey(key, (PROPERTYKEY{}))) << index;
  }
}

TEST_F(PropertyStore, RefusesOtherKeys) {
  ScriptedStream stream(MrcBytes());
  const Handler handler = Open(stream);
  for (const PROPERTYKEY& key :
       {PROPERTYKEY{kSummary, 2}, PROPERTYKEY{kSummary, 3}, PROPERTYKEY{kImageSummary, 6},
        PROPERTYKEY{kImageSummary, 5}, PROPERTYKEY{kImageSummary, 8}, PROPERTYKEY{kImageSummary, 0},
        PROPERTYKEY{kOtherSet, 3}, PROPERTYKEY{kOtherSet, 6}, PROPERTYKEY{}}) {
    EXPECT_EQ(Refusal(handler, key), E_UNEXPECTED) << key.pid;
  }
}

TEST_F(PropertyStore, ZeroesTheWholeValueWithoutClearingIt) {
  ScriptedStream stream(MrcBytes());
  const Handler handler = Open(stream);
  const char zeros[sizeof(PROPVARIANT)] = {};
  PROPVARIANT value;
  // Clearing this as a value would free the invalid pointer in it.
  std::memset(&value, 0x5A, sizeof value);
  value.vt = VT_LPWSTR;
  EXPECT_EQ(handler->GetValue({kOtherSet, 3}, &value), E_UNEXPECTED);
  EXPECT_EQ(std::memcmp(&value, zeros, sizeof value), 0);

  std::memset(&value, 0x5A, sizeof value);
  EXPECT_EQ(handler->GetValue(kWidthKey, &value), S_OK);
  EXPECT_EQ(TakeValue(value), Number(VT_UI4, 512));
}

TEST_F(PropertyStore, RefusesEveryValueBeforeItIsInitializedAndWritesNothing) {
  const Handler handler = Make();
  for (const PROPERTYKEY& key : {kWidthKey, kCommentsKey, PROPERTYKEY{kOtherSet, 3}}) {
    PROPVARIANT value{};
    value.vt = VT_I4;
    value.lVal = 77;
    EXPECT_EQ(handler->GetValue(key, &value), E_FAIL);
    EXPECT_EQ(TakeValue(value), Number(VT_I4, 77));
  }
}

TEST_F(PropertyStore, RefusesEveryValueOfAnInvalidFile) {
  ScriptedStream wrong(MrcFile{.nx = 0}.Bytes());
  EXPECT_EQ(Refusal(Open(wrong), kWidthKey), E_FAIL);
  ScriptedStream shortHeader(MrcBytes().substr(0, 1023));
  EXPECT_EQ(Refusal(Open(shortHeader), kWidthKey), E_FAIL);
  ScriptedStream empty("");
  EXPECT_EQ(Open(empty)->GetValue(kWidthKey, nullptr), E_FAIL);
  for (const CLSID& clsid : {kMrcHandlerClass, kEbnHandlerClass, kRawHandlerClass}) {
    EXPECT_EQ(Refusal(Open(empty, clsid), kWidthKey), E_FAIL);
  }
}

TEST_F(PropertyStore, TreatsANullStreamAsEmpty) {
  for (const CLSID& clsid : {kMrcHandlerClass, kEbnHandlerClass, kRawHandlerClass}) {
    const Handler handler = Make(clsid);
    Initialize(handler, nullptr);
    EXPECT_EQ(Refusal(handler, kWidthKey), E_FAIL);
    EXPECT_EQ(handler->Commit(), E_FAIL);
  }
}

TEST_F(PropertyStore, RejectsNullOutputPointers) {
  ScriptedStream stream(MrcBytes());
  const Handler handler = Open(stream);
  EXPECT_EQ(handler->GetCount(nullptr), E_POINTER);
  EXPECT_EQ(handler->GetAt(0, nullptr), E_POINTER);
  EXPECT_EQ(handler->GetValue(kWidthKey, nullptr), E_POINTER);
}

TEST_F(PropertyStore, RefusesChanges) {
  ScriptedStream stream(MrcBytes());
  const Handler handler = Open(stream);
  PROPVARIANT value{};
  value.vt = VT_UI4;
  value.ulVal = 7;
  for (const PROPERTYKEY& key : {kWidthKey, kCommentsKey, PROPERTYKEY{kOtherSet, 3}}) {
    EXPECT_EQ(handler->SetValue(key, value), E_FAIL);
    EXPECT_EQ(
        As<IPropertyStoreCapabilities>(handler, IID_IPropertyStoreCapabilities)->IsPropertyWritable(key),
        S_FALSE);
  }
  EXPECT_EQ(handler->Commit(), E_FAIL);
  EXPECT_EQ(Read(handler, kWidthKey), Number(VT_UI4, 512));
  EXPECT_EQ(stream.writes, 0);
}

TEST_F(PropertyStore, HoldsOneReferenceToItsStream) {
  ScriptedStream stream(MrcBytes() + MrcBytes());
  {
    const Handler handler = Open(stream);
    EXPECT_EQ(stream.references, 2u);
    Initialize(handler, &stream);
    EXPECT_EQ(stream.references, 2u);
  }
  EXPECT_EQ(stream.references, 1u);
}

TEST_F(PropertyStore, SwitchesToAnotherStream) {
  ScriptedStream first(MrcBytes(512, 256));
  ScriptedStream second(MrcBytes(64, 32));
  const Handler handler = Open(first);
  Initialize(handler, &second);
  EXPECT_EQ(first.references, 1u);
  EXPECT_EQ(second.references, 2u);
  EXPECT_EQ(Read(handler, kDimensionsKey), Text(VT_LPWSTR, L"(64 x 32) 8 bit unsigned"));
}

TEST_F(PropertyStore, ContinuesAtThePositionOfTheSameStream) {
  // The first header is read to its last byte and no further, so the second header follows.
  const MrcFile first{.nx = 512, .ny = 256};
  const MrcFile second{.nx = 64, .ny = 32};
  ScriptedStream stream(first.Bytes() + second.Bytes());
  const Handler handler = Open(stream);
  Initialize(handler, &stream);
  EXPECT_EQ(Read(handler, kDimensionsKey), Text(VT_LPWSTR, L"(64 x 32) 8 bit unsigned"));
}

TEST_F(PropertyStore, StaysWithoutValuesOnceAStreamHasFailed) {
  ScriptedStream bad("");
  ScriptedStream good(MrcBytes());
  const Handler handler = Open(bad);
  Initialize(handler, &good);
  EXPECT_EQ(Refusal(handler, kWidthKey), E_FAIL);
}

TEST_F(PropertyStore, DropsItsStreamAtCommitAndKeepsItsValues) {
  ScriptedStream stream(MrcBytes());
  const Handler handler = Open(stream);
  EXPECT_EQ(handler->Commit(), E_FAIL);
  EXPECT_EQ(stream.references, 1u);
  EXPECT_EQ(Read(handler, kWidthKey), Number(VT_UI4, 512));
  EXPECT_EQ(handler->Commit(), E_FAIL);
  EXPECT_EQ(stream.references, 1u);
}

TEST_F(PropertyStore, ReadsTheHeaderAndNothingElse) {
  const struct {
    CLSID clsid;
    std::string bytes;
  } kinds[] = {
      {kMrcHandlerClass, MrcBytes()}, {kEbnHandlerClass, EbnBytes()}, {kRawHandlerClass, RawBytes()}};
  for (const auto& [clsid, bytes] : kinds) {
    ScriptedStream stream(bytes);
    {
      const Handler handler = Open(stream, clsid);
      for (const PROPERTYKEY& key : kAllKeys) Read(handler, key);
    }
    EXPECT_EQ(stream.wanted, std::vector<ULONG>{1024});
    EXPECT_EQ(stream.writes, 0);
    EXPECT_EQ(stream.otherCalls, 0);
  }
}

TEST_F(PropertyStore, ReadsAStreamThatReturnsOneByteAtATime) {
  ScriptedStream mrc(MrcBytes());
  mrc.maxPerRead = 1;
  EXPECT_EQ(Read(Open(mrc), kWidthKey), Number(VT_UI4, 512));
  EXPECT_EQ(mrc.reads, 1024);
  ScriptedStream ebn(EbnBytes());
  ebn.maxPerRead = 1;
  EXPECT_EQ(Read(Open(ebn, kEbnHandlerClass), kWidthKey), Number(VT_UI4, 300));
  EXPECT_EQ(ebn.reads, 54);
  ScriptedStream raw(RawBytes());
  raw.maxPerRead = 1;
  EXPECT_EQ(Read(Open(raw, kRawHandlerClass), kWidthKey), Number(VT_UI4, 48));
  EXPECT_EQ(raw.reads, 49);
}

TEST_F(PropertyStore, NeedsEveryReadOfTheHeader) {
  const struct {
    CLSID clsid;
    std::string bytes;
    int reads;  // one byte each
  } kinds[] = {{kMrcHandlerClass, MrcBytes(), 1024},
               {kEbnHandlerClass, EbnBytes(), 54},
               {kRawHandlerClass, RawBytes(), 49}};
  for (const auto& [clsid, bytes, reads] : kinds) {
    for (int failing = 1; failing <= reads + 1; ++failing) {
      ScriptedStream stream(bytes);
      stream.maxPerRead = 1;
      stream.failingRead = failing;
      EXPECT_EQ(ReadWidth(Open(stream, clsid)), failing <= reads ? E_FAIL : S_OK) << failing;
      EXPECT_EQ(stream.references, 1u);
    }
  }
}

TEST_F(PropertyStore, AcceptsBytesReturnedWithSFalse) {
  ScriptedStream stream(MrcBytes());
  stream.readResult = S_FALSE;
  stream.maxPerRead = 100;
  EXPECT_EQ(Read(Open(stream), kWidthKey), Number(VT_UI4, 512));
}

TEST_F(PropertyStore, EndsWhenAStreamReturnsSFalse) {
  ScriptedStream stream(MrcBytes().substr(0, 1000));
  stream.endResult = S_FALSE;
  EXPECT_EQ(ReadWidth(Open(stream)), E_FAIL);
}

TEST_F(PropertyStore, IsSafeFromAStreamThatClaimsMoreThanWasRequested) {
  ScriptedStream stream(MrcBytes());
  stream.overclaim = 1'000'000;
  EXPECT_EQ(Read(Open(stream), kWidthKey), Number(VT_UI4, 512));
  ScriptedStream shortStream(MrcBytes().substr(0, 100));
  shortStream.overclaim = 100'000;
  ReadWidth(Open(shortStream));
  EXPECT_EQ(shortStream.references, 1u);
}

TEST_F(PropertyStore, LetsOneCallerAtATimeUseItsStream) {
  const std::string bytes = MrcFile{.nx = 512, .ny = 256}.Bytes();
  ScriptedStream streams[] = {ScriptedStream(bytes), ScriptedStream(bytes)};
  std::atomic<int> wrong = 0;
  {
    const Handler handler = Make();
    const auto initializer = As<IInitializeWithStream>(handler, IID_IInitializeWithStream);
    const auto work = [&](ScriptedStream& stream) {
      stream.maxPerRead = 64;
      for (int i = 0; i < 500; ++i) {
        stream.position = 0;
        initializer->Initialize(&stream, STGM_READ);
        PROPVARIANT value{};
        handler->GetValue(kDimensionsKey, &value);
        if (TakeValue(value) != Text(VT_LPWSTR, L"(512 x 256) 8 bit unsigned")) ++wrong;
      }
    };
    std::thread other(work, std::ref(streams[0]));
    work(streams[1]);
    other.join();
  }
  EXPECT_EQ(wrong, 0);
  EXPECT_EQ(streams[0].references, 1u);
  EXPECT_EQ(streams[1].references, 1u);
}

TEST_F(PropertyStore, KeepsTheServerLoaded) {
  {
    const Handler handler = Make();
    EXPECT_EQ(dll_.CanUnloadNow(), S_FALSE);
  }
  EXPECT_EQ(dll_.CanUnloadNow(), S_OK);
}

}  // namespace
}  // namespace Qel::Lumetra::ShellExt::Testing
