// Tests the release DLL when memory runs out. Every single request of the DLL for memory, a string, a lock or
// a bitmap fails once. The call must end with the promised result and leave nothing allocated, and the object
// must work again as soon as there is memory.
#include <gtest/gtest.h>
#include <windows.h>

#include <propsys.h>
#include <shlobj.h>

#include <algorithm>
#include <array>
#include <exception>
#include <functional>
#include <new>
#include <optional>
#include <string>
#include <thread>
#include <utility>
#include <vector>

#include "bitmap_pixels.h"
#include "process_census.h"
#include "sample_files.h"
#include "scarce_system.h"
#include "scripted_stream.h"
#include "server_dll.h"
#include "shell_values.h"
#include "temp_folder.h"

namespace Qel::Lumetra::ShellExt::Testing {
namespace {

using Then = ScarceSystem::Then;

/// The result of a method. Empty if it throws std::bad_alloc, which no method catches.
using Result = std::optional<HRESULT>;
constexpr Result kThrew = std::nullopt;
constexpr Result kNoMemory = E_OUTOFMEMORY;
constexpr Result kNoBitmap = E_FAIL;

/// Not larger than any sample, because a colour frame must not be smaller than the request.
constexpr SIZE kRequest = {2, 2};

/// One request of the shell.
struct Request {
  std::function<void()> prepare;  // prepares the call, while there is memory
  std::function<HRESULT()> send;
  std::function<void()> check;  // checks and frees the answer of a call that has succeeded

  Result withoutMemory;             // the result when the C runtime has no memory
  Result withoutOther = kNoMemory;  // the result when anything else fails
  int madeObjects = 0;              // allocations for COM objects; their failure gives E_OUTOFMEMORY
  int firstPlace = 0;               // the first place that fails
};

Result Send(const Request& request, Then then) {
  try {
    return request.send();
  } catch (const std::bad_alloc&) {
    // Without memory the exception is in the DLL's emergency reserve, which has room for a few hundred
    // exceptions. This program's heap must not free it, so a reference to it is kept permanently.
    static auto* const kept = new std::vector<std::exception_ptr>();
    if (then == Then::kKeepsFailing) kept->push_back(std::current_exception());
    return kThrew;
  }
}

/// Sends `request` while one place in the DLL fails: its request for memory, a string, a lock or a bitmap
/// with the index `number`. Returns whether there is such a place.
bool FailOnce(const Request& request, std::int64_t number, Then then, int* objectsNotMade = nullptr) {
  request.prepare();
  ScarceSystem::FailAt(number, then);
  const Result result = Send(request, then);
  const ScarceSystem::Lack lack = ScarceSystem::Recover();
  const bool failed = lack != ScarceSystem::Lack::kNothing;
  if (request.madeObjects > 0 && lack == ScarceSystem::Lack::kMemory && result == kNoMemory) {
    if (objectsNotMade != nullptr) ++*objectsNotMade;
  } else if (failed && then == Then::kKeepsFailing && result == request.withoutMemory) {
    // After the first failure an allocation failed too.
  } else if (failed) {
    EXPECT_EQ(result, lack == ScarceSystem::Lack::kMemory ? request.withoutMemory : request.withoutOther)
        << "place " << number;
  }
  // The same request to the same object must succeed now.
  EXPECT_EQ(failed ? request.send() : result, S_OK) << "place " << number;
  request.check();
  return failed;
}

/// Makes every place fail, one after the other. Returns the number of places.
int FailEverywhere(const Request& request, Then then) {
  int places = request.firstPlace;
  int objectsNotMade = 0;
  while (FailOnce(request, places, then, &objectsNotMade)) ++places;
  EXPECT_EQ(objectsNotMade, request.madeObjects);
  return places;
}

/// Makes every place fail, each time in a new thread that has never handled an exception.
void FailEverywhereInNewThreads(const Request& request) {
  bool failed = true;
  for (int number = request.firstPlace; failed; ++number) {
    std::thread([&] { failed = FailOnce(request, number, Then::kKeepsFailing); }).join();
  }
}

class DllOutOfMemory : public ServerTest {
 protected:
  ~DllOutOfMemory() override { Forget(); }

  /// Makes everything that `request` needs fail in every way, and checks that nothing is left allocated.
  void Try(const Request& request) {
    EXPECT_GT(FailEverywhere(request, Then::kRecovers), 0);
    FailEverywhere(request, Then::kKeepsFailing);
    FailEverywhereInNewThreads(request);
    ExpectNothingLeft(request);
  }

  /// Checks that repeating the failures leaves nothing. The system's permanent allocations occur once; a leak
  /// grows with every round.
  void ExpectNothingLeft(const Request& request) {
    const auto take = [&] {
      FailEverywhere(request, Then::kRecovers);
      Forget();
      return ProcessCensus::Take();
    };
    ProcessCensus least = take();
    bool grows = true;
    for (int round = 0; round < 3 && grows; ++round) {
      const ProcessCensus next = take();
      grows = next.heapBlocks > least.heapBlocks || next.handles > least.handles ||
              next.gdiObjects > least.gdiObjects;
      least = next;
    }
    EXPECT_FALSE(grows) << "every round leaves something allocated";
    EXPECT_EQ(dll_.LockCount(), 0);
  }

  void Forget() {
    enumerator_ = {};
    copy_ = {};
    storage_ = {};
    handler_ = {};
    object_ = {};
  }

  void WriteSample(const char* kind, const SampleFile& sample) {
    path_ = folder_.Write(std::string("sample.") + kind, sample.bytes);
  }

  HRESULT Load() { return Ask<IPersistFile>(IID_IPersistFile)->Load(path_.c_str(), STGM_READ); }

  void MakeLoaded() {
    Forget();
    object_ = dll_.CreateInstance<IUnknown>(kShellExtClass, IID_IUnknown);
    EXPECT_EQ(Load(), S_OK);
    DWORD flags = 0;
    EXPECT_EQ(Ask<IExtractImage>(IID_IExtractImage)->GetLocation(nullptr, 0, nullptr, &kRequest, 24, &flags),
              S_OK);
  }

  template <class Interface>
  ComPtr<Interface> Ask(const IID& iid) {
    return As<Interface>(object_, iid);
  }

  HRESULT Extract() {
    const HRESULT result = Ask<IExtractImage>(IID_IExtractImage)->Extract(&bitmap_);
    if (result == E_FAIL) {
      EXPECT_EQ(bitmap_, nullptr);
    }
    return result;
  }

  TempFolder folder_;
  ScarceSystem system_{dll_.module()};
  std::filesystem::path path_;

  ComPtr<IUnknown> object_;
  ComPtr<IPropertyStorage> storage_;
  ComPtr<IEnumSTATPROPSTG> enumerator_;
  ComPtr<IEnumSTATPROPSTG> copy_;
  ComPtr<IPropertyStore> handler_;
  HBITMAP bitmap_ = nullptr;
};

TEST_F(DllOutOfMemory, WhileAnObjectIsMade) {
  for (const CLSID& clsid : {kShellExtClass, kEbnHandlerClass, kRawHandlerClass, kMrcHandlerClass}) {
    const ComPtr<IClassFactory> factory = dll_.Factory(clsid);
    OuterObject outer;
    for (IUnknown* const whole : {static_cast<IUnknown*>(nullptr), static_cast<IUnknown*>(&outer)}) {
      const Request request{[&] { object_ = {}; },
                            [&] {
                              return factory->CreateInstance(whole, IID_IUnknown,
                                                             reinterpret_cast<void**>(object_.Put()));
                            },
                            [&] { EXPECT_EQ(References(object_), 0u); }, kNoMemory};
      FailEverywhere(request, Then::kRecovers);
      FailEverywhere(request, Then::kKeepsFailing);
      FailEverywhereInNewThreads(request);
      object_ = {};
      EXPECT_EQ(outer.references(), 1u);
    }
    EXPECT_EQ(References(factory), 1u);
  }
}

TEST_F(DllOutOfMemory, WhileAFileIsLoaded) {
  for (const char* const kind : kSampleKinds) {
    WriteSample(kind, SampleFiles(kind).front());
    Try({[&] {
           Forget();
           object_ = dll_.CreateInstance<IUnknown>(kShellExtClass, IID_IUnknown);
         },
         [&] {
           try {
             return Load();
           } catch (const std::bad_alloc&) {
             // The object has no file, as after Load of an invalid one. The shell would make a new object.
             EXPECT_EQ(Ask<IExtractImage>(IID_IExtractImage)->Extract(&bitmap_), E_FAIL);
             throw;
           }
         },
         [] {}, kThrew});
  }
}

class DllOutOfMemoryOfKind : public DllOutOfMemory, public testing::WithParamInterface<const char*> {};

TEST_P(DllOutOfMemoryOfKind, WhileAThumbnailIsMade) {
  BitmapPixels picture;
  Request request{[] {}, [&] { return Extract(); }, [&] { EXPECT_EQ(TakeBitmap(bitmap_), picture); }, kThrew,
                  kNoBitmap};
  for (const SampleFile& sample : SampleFiles(GetParam())) {
    SCOPED_TRACE(sample.name);
    WriteSample(GetParam(), sample);
    MakeLoaded();
    ASSERT_EQ(Extract(), S_OK);
    picture = TakeBitmap(bitmap_);
    EXPECT_GT(FailEverywhere(request, Then::kRecovers), 0);
    FailEverywhere(request, Then::kKeepsFailing);
    FailEverywhereInNewThreads(request);
  }
  request.prepare = [&] { MakeLoaded(); };
  ExpectNothingLeft(request);
}

INSTANTIATE_TEST_SUITE_P(All, DllOutOfMemoryOfKind, testing::ValuesIn(kSampleKinds),
                         [](const auto& kind) { return kind.param; });

TEST_F(DllOutOfMemory, WhileATipIsMade) {
  WriteSample("mrc", SampleFiles("mrc").front());
  wchar_t* tip = nullptr;
  Try({[&] { MakeLoaded(); },
       [&] { return Ask<IQueryInfo>(IID_IQueryInfo)->GetInfoTip(QITIPF_DEFAULT, &tip); },
       [&] {
         EXPECT_NE(std::wstring(tip).find(L"another"), std::wstring::npos);
         CoTaskMemFree(tip);
       },
       kThrew});
}

TEST_F(DllOutOfMemory, WhileAColumnIsRead) {
  WriteSample("mrc", SampleFiles("mrc").front());
  SHCOLUMNDATA item{};
  path_.native().copy(item.wszFile, std::size(item.wszFile) - 1);
  for (const PROPERTYKEY& column : {kWidthKey, kDimensionsKey, kCommentsKey}) {
    VARIANT value{};
    Try({[&] { MakeLoaded(); },
         [&] { return Ask<IColumnProvider>(IID_IColumnProvider)->GetItemData(&column, &item, &value); },
         [&] { EXPECT_NE(TakeValue(value), Value()); }, kThrew});
  }
}

/// The allocations of a property storage: the object, and the map that it shares with its enumerators.
constexpr int kAllocationsOfAStorage = 2;

TEST_F(DllOutOfMemory, WhilePropertySetsAreBuiltAndListed) {
  WriteSample("mrc", SampleFiles("mrc").front());
  Try({.prepare = [&] { MakeLoaded(); },
       .send =
           [&] {
             return Ask<IPropertySetStorage>(IID_IPropertySetStorage)
                 ->Open(kImageSummary, STGM_READ, storage_.Put());
           },
       .check = [&] { EXPECT_TRUE(storage_); },
       .withoutMemory = kThrew,
       .madeObjects = 2 * kAllocationsOfAStorage});

  ComPtr<IEnumSTATPROPSETSTG> sets;
  Try({.prepare = [&] { MakeLoaded(); },
       .send = [&] { return Ask<IPropertySetStorage>(IID_IPropertySetStorage)->Enum(sets.Put()); },
       .check = [&] { sets = {}; },
       .withoutMemory = kThrew,
       .madeObjects = 2 * kAllocationsOfAStorage + 1});
}

TEST_F(DllOutOfMemory, WhileAPropertySetIsRead) {
  WriteSample("mrc", SampleFiles("mrc").front());
  const auto open = [&] {
    MakeLoaded();
    EXPECT_EQ(
        Ask<IPropertySetStorage>(IID_IPropertySetStorage)->Open(kImageSummary, STGM_READ, storage_.Put()),
        S_OK);
  };
  PROPSPEC specifier{};
  specifier.ulKind = PRSPEC_PROPID;
  specifier.propid = kDimensionsKey.pid;
  PROPVARIANT value{};
  Try({open, [&] { return storage_->ReadMultiple(1, &specifier, &value); },
       [&] { EXPECT_EQ(TakeValue(value), Text(VT_BSTR, L"7 x 5")); }, kNoMemory});
  Try({open, [&] { return storage_->Enum(enumerator_.Put()); }, [] {}, kNoMemory});
  Try({[&] {
         open();
         EXPECT_EQ(storage_->Enum(enumerator_.Put()), S_OK);
       },
       [&] { return enumerator_->Clone(copy_.Put()); }, [] {}, kNoMemory});
}

TEST_F(DllOutOfMemory, WhileAPropertyStoreIsFilledAndRead) {
  struct Handler {
    CLSID clsid;
    const char* kind;
  };
  for (const Handler& kind : {Handler{kMrcHandlerClass, "mrc"}, Handler{kEbnHandlerClass, "ebn"},
                              Handler{kRawHandlerClass, "raw"}}) {
    SCOPED_TRACE(kind.kind);
    const std::string bytes = SampleFiles(kind.kind).front().bytes;
    ScriptedStream stream(bytes);
    const auto initialize = [&] {
      stream.position = 0;
      return As<IInitializeWithStream>(handler_, IID_IInitializeWithStream)->Initialize(&stream, STGM_READ);
    };
    const auto make = [&] {
      Forget();
      EXPECT_EQ(stream.references, 1u);
      handler_ = dll_.CreateInstance<IPropertyStore>(kind.clsid, IID_IPropertyStore);
    };
    PROPVARIANT value{};
    const auto read = [&] { return handler_->GetValue(kDimensionsKey, &value); };
    const auto check = [&] { EXPECT_EQ(TakeValue(value).type, VT_LPWSTR); };

    // Without a buffer for its stream, a store has no file, as after an invalid one.
    make();
    ScarceSystem::FailAt(0, Then::kRecovers);
    EXPECT_EQ(initialize(), S_OK);
    EXPECT_EQ(ScarceSystem::Recover(), ScarceSystem::Lack::kMemory);
    EXPECT_EQ(read(), E_FAIL);
    EXPECT_EQ(TakeValue(value), Value());

    Try({.prepare = make,
         .send = initialize,
         .check =
             [&] {
               EXPECT_EQ(read(), S_OK);
               check();
             },
         .withoutMemory = kThrew,
         .firstPlace = 1});
    Try({[&] {
           make();
           EXPECT_EQ(initialize(), S_OK);
         },
         read, check, kThrew});
    EXPECT_EQ(stream.references, 1u);
  }
}

/// Uses a DLL that has not made the class object yet, because it keeps the class object afterwards.
TEST(FreshDllOutOfMemory, WhileAClassObjectIsMade) {
  for (const Then then : {Then::kRecovers, Then::kKeepsFailing}) {
    bool failed = true;
    for (int number = 0; failed; ++number) {
      const ServerDll dll;
      const ScarceSystem system(dll.module());
      ComPtr<IClassFactory> factory;
      failed = FailOnce({[] {},
                         [&] {
                           return dll.GetClassObject(kShellExtClass, IID_IClassFactory,
                                                     reinterpret_cast<void**>(factory.Put()));
                         },
                         [&] { EXPECT_EQ(References(factory), 1u); }, kNoMemory},
                        number, then);
      factory = {};
      EXPECT_EQ(dll.CanUnloadNow(), S_OK);
    }
  }
}

}  // namespace
}  // namespace Qel::Lumetra::ShellExt::Testing
