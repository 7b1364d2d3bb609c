#include <gtest/gtest.h>
#include <windows.h>

#include <propsys.h>
#include <shlobj.h>

#include <array>
#include <cstddef>
#include <cwchar>
#include <stdexcept>
#include <string>
#include <utility>

#include "bitmap_pixels.h"
#include "emi_file.h"
#include "mrc_file.h"
#include "process_census.h"
#include "ser_file.h"
#include "server_dll.h"
#include "temp_folder.h"
#include "unused_file.h"

namespace Qel::Lumetra::ShellExt::Testing {
namespace {

/// The interfaces in the order of their vtable pointers in the object.
const IID kInterfaces[] = {
    {0xBB2E617C, 0x0920, 0x11D1, {0x9A, 0x0B, 0x00, 0xC0, 0x4F, 0xC2, 0xD6, 0xC1}},  // IExtractImage
    {0x0000010B, 0x0000, 0x0000, {0xC0, 0x00, 0x00, 0x00, 0x00, 0x00, 0x00, 0x46}},  // IPersistFile
    {0x00021500, 0x0000, 0x0000, {0xC0, 0x00, 0x00, 0x00, 0x00, 0x00, 0x00, 0x46}},  // IQueryInfo
    {0xE8025004, 0x1C42, 0x11D2, {0xBE, 0x2C, 0x00, 0xA0, 0xC9, 0xA8, 0x3D, 0xA1}},  // IColumnProvider
    {0x0000013A, 0x0000, 0x0000, {0xC0, 0x00, 0x00, 0x00, 0x00, 0x00, 0x00, 0x46}},  // IPropertySetStorage
};

const HBITMAP kUntouched = reinterpret_cast<HBITMAP>(0x1234);

/// An object of the class, with the interfaces that the tests use.
struct ShellExt {
  explicit ShellExt(const ServerDll& dll)
      : image(dll.CreateInstance<IExtractImage>(kShellExtClass, IID_IExtractImage)),
        file(As<IPersistFile>(image, IID_IPersistFile)) {}

  HRESULT Load(const std::filesystem::path& path) const { return file->Load(path.c_str(), STGM_READ); }

  HRESULT GetLocation(const SIZE& size) const {
    DWORD flags = 0;
    return image->GetLocation(nullptr, 0, nullptr, &size, 24, &flags);
  }

  ComPtr<IExtractImage> image;
  ComPtr<IPersistFile> file;
};

/// Returns a file of one section whose pixel bytes are all the same.
std::string OneSectionMrc(std::int32_t width, std::int32_t height, std::int32_t mode = 0,
                          std::size_t bytesPerPixel = 1) {
  MrcFile file;
  file.nx = width;
  file.ny = height;
  file.mode = mode;
  file.pixels.assign(static_cast<std::size_t>(width) * static_cast<std::size_t>(height) * bytesPerPixel, 7);
  return file.Bytes();
}

class ShellExtObject : public ServerTest {
 protected:
  /// Returns the size of the thumbnail that Extract makes of an 8-bit frame of this size. A null `request`
  /// leaves out GetLocation.
  SIZE ThumbnailSize(std::int32_t width, std::int32_t height, const SIZE* request) {
    const ShellExt object(dll_);
    EXPECT_EQ(object.Load(folder_.Write("frame.mrc", OneSectionMrc(width, height))), S_OK);
    if (request != nullptr) {
      EXPECT_EQ(object.GetLocation(*request), S_OK);
    }
    HBITMAP bitmap = kUntouched;
    EXPECT_EQ(object.image->Extract(&bitmap), S_OK);
    const BitmapPixels pixels = TakeBitmap(bitmap);
    return {pixels.width, pixels.height};
  }

  /// Returns the failure of Extract for a file without a thumbnail. It must not change the caller's handle.
  HRESULT RefusedExtract(const std::filesystem::path& path) {
    const ShellExt object(dll_);
    EXPECT_EQ(object.Load(path), S_OK);
    HBITMAP bitmap = kUntouched;
    const HRESULT result = object.image->Extract(&bitmap);
    EXPECT_EQ(bitmap, kUntouched);
    return result;
  }

  TempFolder folder_;
};

TEST_F(ShellExtObject, HasItsFiveInterfacesWithOneIdentity) {
  for (const IID& from : kInterfaces) {
    const auto answer = dll_.CreateInstance<IUnknown>(kShellExtClass, from);
    const auto identity = As<IUnknown>(answer, IID_IUnknown);
    for (const IID& to : kInterfaces) {
      EXPECT_EQ(As<IUnknown>(As<IUnknown>(answer, to), IID_IUnknown).Get(), identity.Get());
    }
    EXPECT_EQ(As<IUnknown>(identity, from).Get(), answer.Get());
    EXPECT_EQ(References(identity), 1u);
  }
}

TEST_F(ShellExtObject, HasItsInterfacesInOrder) {
  const auto object = dll_.CreateInstance<IUnknown>(kShellExtClass, IID_IUnknown);
  const auto* const start = reinterpret_cast<const std::byte*>(object.Get());
  std::ptrdiff_t place = 0;
  for (const IID& iid : kInterfaces) {
    EXPECT_EQ(reinterpret_cast<const std::byte*>(As<IUnknown>(object, iid).Get()) - start, place);
    place += static_cast<std::ptrdiff_t>(sizeof(void*));
  }
}

TEST_F(ShellExtObject, RefusesEveryOtherInterface) {
  const auto object = dll_.CreateInstance<IUnknown>(kShellExtClass, IID_IUnknown);
  for (const IID& iid : {IID_IPersist, IID_IClassFactory, IID_IExtractImage2, IID_IInitializeWithStream,
                         IID_IDispatch, IID_IMarshal}) {
    void* answer = &answer;
    EXPECT_EQ(object->QueryInterface(iid, &answer), E_NOINTERFACE);
    EXPECT_EQ(answer, nullptr);
  }
  EXPECT_EQ(object->QueryInterface(IID_IExtractImage, nullptr), E_POINTER);
  EXPECT_EQ(References(object), 0u);
}

TEST_F(ShellExtObject, WorksAsPartOfAnotherObject) {
  OuterObject outer;
  outer.inner = dll_.CreateInstance<IUnknown>(kShellExtClass, IID_IUnknown, &outer);
  {
    const auto file = As<IPersistFile>(outer.inner, IID_IPersistFile);
    EXPECT_EQ(file->Load(folder_.Write("grid.mrc", OneSectionMrc(3, 2)).c_str(), 0), S_OK);
    for (const IID& iid : kInterfaces) {
      const auto answer = As<IUnknown>(file, iid);
      EXPECT_EQ(As<IUnknown>(answer, IID_IUnknown).Get(), &outer);
    }
    void* answer = nullptr;
    EXPECT_EQ(file->QueryInterface(IID_IPersist, &answer), E_NOINTERFACE);
    HBITMAP bitmap = nullptr;
    EXPECT_EQ(As<IExtractImage>(file, IID_IExtractImage)->Extract(&bitmap), S_OK);
    EXPECT_EQ(TakeBitmap(bitmap).width, 3);
  }
  EXPECT_EQ(outer.references(), 1u);
}

TEST_F(ShellExtObject, GetLocationOnlyAddsTheCacheFlag) {
  const ShellExt object(dll_);
  const SIZE size{256, 96};
  std::array<wchar_t, MAX_PATH> path{};
  path.fill(L'x');
  const auto untouchedPath = path;
  for (const DWORD flags : {DWORD{IEIFLAG_ASYNC}, DWORD{0}, DWORD{IEIFLAG_CACHE}, ~DWORD{0}}) {
    DWORD priority = 77;
    DWORD newFlags = flags;
    EXPECT_EQ(object.image->GetLocation(path.data(), MAX_PATH, &priority, &size, 24, &newFlags), S_OK);
    EXPECT_EQ(newFlags, flags | 2);
    EXPECT_EQ(priority, 77u);
    EXPECT_EQ(path, untouchedPath);
  }
}

TEST_F(ShellExtObject, GetLocationRequiresSizeAndFlags) {
  const ShellExt object(dll_);
  const SIZE size{256, 96};
  DWORD flags = 1;
  EXPECT_EQ(object.image->GetLocation(nullptr, 0, nullptr, nullptr, 24, &flags), E_POINTER);
  EXPECT_EQ(flags, 1u);
  EXPECT_EQ(object.image->GetLocation(nullptr, 0, nullptr, &size, 24, nullptr), E_POINTER);
}

// A frame is reduced by the largest whole factor that leaves its width or its height no smaller than the
// request: the factor becomes 2 exactly at twice the request.

TEST_F(ShellExtObject, ExtractsAtTheSizeOfGetLocation) {
  const SIZE request{256, 96};
  EXPECT_EQ(ThumbnailSize(511, 1, &request).cx, 511);
  EXPECT_EQ(ThumbnailSize(512, 2, &request).cx, 256);
  EXPECT_EQ(ThumbnailSize(1, 191, &request).cy, 191);
  EXPECT_EQ(ThumbnailSize(2, 192, &request).cy, 96);
}

TEST_F(ShellExtObject, ExtractsAt128By128WithoutGetLocation) {
  EXPECT_EQ(ThumbnailSize(255, 1, nullptr).cx, 255);
  EXPECT_EQ(ThumbnailSize(256, 2, nullptr).cx, 128);
  EXPECT_EQ(ThumbnailSize(1, 255, nullptr).cy, 255);
  EXPECT_EQ(ThumbnailSize(2, 256, nullptr).cy, 128);
}

TEST_F(ShellExtObject, ExtractsAtTheSizeOfTheLastGetLocationEveryTime) {
  const ShellExt object(dll_);
  ASSERT_EQ(object.GetLocation({4, 4}), S_OK);
  ASSERT_EQ(object.Load(folder_.Write("grid.mrc", OneSectionMrc(32, 16))), S_OK);
  for (const std::int32_t size : {8, 16, 8, 2}) {
    ASSERT_EQ(object.GetLocation({size, size}), S_OK);
    for (int i = 0; i < 2; ++i) {
      HBITMAP bitmap = nullptr;
      EXPECT_EQ(object.image->Extract(&bitmap), S_OK);
      EXPECT_EQ(TakeBitmap(bitmap).height, size / 2) << size;
    }
  }
}

TEST_F(ShellExtObject, ExtractRequiresAnOutputPointer) {
  const ShellExt object(dll_);
  EXPECT_EQ(object.image->Extract(nullptr), E_POINTER);
  ASSERT_EQ(object.Load(folder_.Write("grid.mrc", OneSectionMrc(3, 2))), S_OK);
  EXPECT_EQ(object.image->Extract(nullptr), E_POINTER);
}

TEST_F(ShellExtObject, ExtractFailsBeforeLoad) {
  const ShellExt object(dll_);
  HBITMAP bitmap = kUntouched;
  EXPECT_EQ(object.image->Extract(&bitmap), E_FAIL);
  EXPECT_EQ(bitmap, kUntouched);
}

TEST_F(ShellExtObject, LoadsAMissingFileAndExtractFails) {
  EXPECT_EQ(RefusedExtract(folder_.path() / "missing.mrc"), E_FAIL);
}

TEST_F(ShellExtObject, LoadsAFileOfAnUnknownKindAndExtractFails) {
  EXPECT_EQ(RefusedExtract(folder_.Write("grid.mrc2", OneSectionMrc(3, 2))), E_FAIL);
  EXPECT_EQ(RefusedExtract(folder_.Write("grid", OneSectionMrc(3, 2))), E_FAIL);
  EXPECT_EQ(RefusedExtract(folder_.Write("v1.2/noext", OneSectionMrc(3, 2))), E_FAIL);
  EXPECT_EQ(RefusedExtract(folder_.Write("v1.mrc/noext", OneSectionMrc(3, 2))), E_FAIL);
}

TEST_F(ShellExtObject, LoadsADamagedFileAndExtractFails) {
  EXPECT_EQ(RefusedExtract(folder_.Write("empty.mrc", "")), E_FAIL);
  EXPECT_EQ(RefusedExtract(folder_.Write("short.mrc", OneSectionMrc(3, 2).substr(0, 1023))), E_FAIL);
  EXPECT_EQ(RefusedExtract(folder_.path()), E_FAIL);
}

TEST_F(ShellExtObject, LoadsANullPathAndExtractFails) {
  const ShellExt object(dll_);
  EXPECT_EQ(object.file->Load(nullptr, 0), S_OK);
  HBITMAP bitmap = kUntouched;
  EXPECT_EQ(object.image->Extract(&bitmap), E_FAIL);
  EXPECT_EQ(bitmap, kUntouched);
}

TEST_F(ShellExtObject, ExtractWritesNullWhenThePixelsCannotBeRead) {
  const ShellExt object(dll_);
  ASSERT_EQ(object.Load(folder_.Write("cut.mrc", OneSectionMrc(3, 2).substr(0, 1024 + 5))), S_OK);
  HBITMAP bitmap = kUntouched;
  EXPECT_EQ(object.image->Extract(&bitmap), E_FAIL);
  EXPECT_EQ(bitmap, nullptr);
}

TEST_F(ShellExtObject, AcceptsExtensionsInAnyCaseAndPathsWithAnyCharacters) {
  const ShellExt object(dll_);
  ASSERT_EQ(object.Load(folder_.Write(L"Gitter \u00e4\u03a9\u4e2d.v2/grid.MRC", OneSectionMrc(3, 2))), S_OK);
  HBITMAP bitmap = nullptr;
  EXPECT_EQ(object.image->Extract(&bitmap), S_OK);
  EXPECT_EQ(TakeBitmap(bitmap).width, 3);
}

TEST_F(ShellExtObject, IgnoresTheModeOfLoad) {
  const auto path = folder_.Write("grid.mrc", OneSectionMrc(3, 2));
  for (const DWORD mode : {DWORD{0}, DWORD{STGM_READWRITE | STGM_SHARE_EXCLUSIVE}, ~DWORD{0}}) {
    const ShellExt object(dll_);
    EXPECT_EQ(object.file->Load(path.c_str(), mode), S_OK);
    HBITMAP bitmap = nullptr;
    EXPECT_EQ(object.image->Extract(&bitmap), S_OK);
    EXPECT_EQ(TakeBitmap(bitmap).width, 3);
  }
}

TEST_F(ShellExtObject, ASecondLoadFindsAFailedStream) {
  const ShellExt object(dll_);
  const auto path = folder_.Write("grid.mrc", OneSectionMrc(3, 2));
  ASSERT_EQ(object.Load(path), S_OK);
  EXPECT_EQ(object.Load(path), S_OK);
  HBITMAP bitmap = kUntouched;
  EXPECT_EQ(object.image->Extract(&bitmap), E_FAIL);
  EXPECT_EQ(bitmap, kUntouched);
}

TEST_F(ShellExtObject, ASecondLoadDestroysTheFirstReader) {
  const auto path = folder_.Write("grid.mrc", OneSectionMrc(3, 2));
  const ShellExt object(dll_);
  const auto heapUseAfter = [&](int loads) {
    for (int i = 0; i < loads; ++i) EXPECT_EQ(object.Load(path), S_OK);
    const ProcessCensus census = ProcessCensus::Take();
    return std::pair(census.heapBlocks, census.heapBytes);
  };
  heapUseAfter(2);  // the system makes its permanent allocations now
  const auto before = heapUseAfter(1);
  EXPECT_EQ(heapUseAfter(200), before);
}

TEST_F(ShellExtObject, OpensAFileAfterOneThatIsMissing) {
  const ShellExt object(dll_);
  ASSERT_EQ(object.Load(folder_.path() / "missing.mrc"), S_OK);
  ASSERT_EQ(object.Load(folder_.Write("grid.mrc", OneSectionMrc(3, 2))), S_OK);
  HBITMAP bitmap = nullptr;
  EXPECT_EQ(object.image->Extract(&bitmap), S_OK);
  EXPECT_EQ(TakeBitmap(bitmap).width, 3);
}

TEST_F(ShellExtObject, KeepsTheFileOpenAndSharedUntilItIsDestroyed) {
  const auto path = folder_.Write("grid.mrc", OneSectionMrc(3, 2));
  const auto open = [&path](DWORD access, DWORD share) {
    const HANDLE file = CreateFileW(path.c_str(), access, share, nullptr, OPEN_EXISTING, 0, nullptr);
    const bool opened = file != INVALID_HANDLE_VALUE;
    if (opened) CloseHandle(file);
    return opened;
  };
  constexpr DWORD kShareAll = FILE_SHARE_READ | FILE_SHARE_WRITE | FILE_SHARE_DELETE;
  {
    const ShellExt object(dll_);
    ASSERT_EQ(object.Load(path), S_OK);
    EXPECT_TRUE(open(GENERIC_READ | GENERIC_WRITE | DELETE, kShareAll));
    EXPECT_FALSE(open(GENERIC_READ, 0));
  }
  EXPECT_TRUE(IsUnused(path));
}

TEST_F(ShellExtObject, ImplementsNothingElseOfIPersistFile) {
  const ShellExt object(dll_);
  ASSERT_EQ(object.Load(folder_.Write("grid.mrc", OneSectionMrc(3, 2))), S_OK);
  CLSID clsid = IID_IStream;
  EXPECT_EQ(object.file->GetClassID(&clsid), E_NOTIMPL);
  EXPECT_EQ(clsid, IID_IStream);
  wchar_t letter = L'x';
  wchar_t* name = &letter;
  EXPECT_EQ(object.file->GetCurFile(&name), E_NOTIMPL);
  EXPECT_EQ(name, &letter);
  EXPECT_EQ(object.file->IsDirty(), E_NOTIMPL);
  EXPECT_EQ(object.file->Save(L"copy.mrc", TRUE), E_NOTIMPL);
  EXPECT_EQ(object.file->SaveCompleted(L"copy.mrc"), E_NOTIMPL);
  HBITMAP bitmap = nullptr;
  EXPECT_EQ(object.image->Extract(&bitmap), S_OK);
  EXPECT_EQ(TakeBitmap(bitmap).width, 3);
}

TEST_F(ShellExtObject, LetsTheExceptionsOfReadersThrough) {
  const ShellExt object(dll_);
  EmiFile emi;
  emi.items = EmiArray(0x2202, 0x0202, "a pixel array outside any image");
  EXPECT_THROW(object.Load(folder_.Write("bad.emi", emi.Bytes())), std::invalid_argument);

  SerFile ser;
  ser.elements.resize(1);
  ser.dimensions[0].unitsLength = -1;
  const ShellExt other(dll_);
  EXPECT_THROW(other.Load(folder_.Write("bad.ser", ser.Bytes())), std::length_error);

  for (const ShellExt* const without : {&object, &other}) {
    HBITMAP bitmap = kUntouched;
    EXPECT_EQ(without->image->Extract(&bitmap), E_FAIL);
    EXPECT_EQ(bitmap, kUntouched);
  }
}

using ShellExtObjectDeathTest = ShellExtObject;

TEST_F(ShellExtObjectDeathTest, AColourFrameSmallerThanTheRequestFaults) {
  const auto path = folder_.Write("colour.mrc", OneSectionMrc(2, 2, 16, 3));
  EXPECT_EXIT(
      {
        const ShellExt object(dll_);
        HBITMAP bitmap = nullptr;
        object.Load(path);
        object.image->Extract(&bitmap);
      },
      [](int status) { return static_cast<DWORD>(status) == 0xC0000094; }, "");
}

}  // namespace
}  // namespace Qel::Lumetra::ShellExt::Testing
