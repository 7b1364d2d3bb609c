// Tests how the objects handle the system's results, failures included. Replacements of the DLL's imports
// supply the results.
#include <gtest/gtest.h>
#include <windows.h>

#include <propsys.h>
#include <shlobj.h>
#include <shlwapi.h>

#include <array>
#include <cstring>
#include <cwchar>
#include <filesystem>
#include <string>
#include <vector>

#include "bitmap_pixels.h"
#include "ebn_file.h"
#include "emi_file.h"
#include "import_patch.h"
#include "mrc_file.h"
#include "raw_file.h"
#include "scripted_stream.h"
#include "ser_file.h"
#include "server_dll.h"
#include "shell_values.h"
#include "temp_folder.h"

namespace Qel::Lumetra::ShellExt::Testing {
namespace {

constexpr HRESULT kFailure = STG_E_MEDIUMFULL;  // no other call here returns this

class SystemAnswers : public ServerTest {
 protected:
  using Object = ComPtr<IUnknown>;

  Object Load(const std::filesystem::path& name, const std::string& bytes) {
    const auto file = folder_.Write(name, bytes);
    Object object = dll_.CreateInstance<IUnknown>(kShellExtClass, IID_IUnknown);
    EXPECT_EQ(As<IPersistFile>(object, IID_IPersistFile)->Load(file.c_str(), STGM_READ), S_OK);
    return object;
  }

  /// Loads a file of 1024 bytes with a comment.
  Object LoadImage() { return Load(L"image.mrc", MrcFile{.labels = {"label"}}.Bytes()); }

  static std::wstring TipOf(const Object& object) {
    wchar_t* tip = nullptr;
    EXPECT_EQ(As<IQueryInfo>(object, IID_IQueryInfo)->GetInfoTip(QITIPF_DEFAULT, &tip), S_OK);
    std::wstring text = tip != nullptr ? tip : L"<none>";
    CoTaskMemFree(tip);
    return text;
  }

  static HRESULT RefusedTip(const Object& object) {
    wchar_t untouched[] = L"untouched";
    wchar_t* tip = untouched;
    const HRESULT result = As<IQueryInfo>(object, IID_IQueryInfo)->GetInfoTip(QITIPF_DEFAULT, &tip);
    EXPECT_EQ(tip, untouched);
    return result;
  }

  template <class Function>
  ImportPatch Answer(const char* name, Function* answer) {
    return ImportPatch(dll_.module(), name, answer);
  }

  TempFolder folder_;
};

// Strings of the string table.

/// A string table that also has the descriptions of the file kinds.
int WINAPI DescribingTable(HINSTANCE module, UINT id, LPWSTR buffer, int room) {
  EXPECT_EQ(room, 256);
  if (id >= 200 && id <= 209) return LoadStringW(module, id, buffer, room);
  return std::swprintf(buffer, static_cast<std::size_t>(room), L"description %u", id);
}

int WINAPI EmptyTable(HINSTANCE, UINT, LPWSTR, int) {
  return 0;
}

TEST_F(SystemAnswers, DescriptionIsTheStringOfTheFileKind) {
  SerFile ser;
  ser.elements.resize(1);
  const struct {
    const wchar_t* name;
    std::string bytes;
    const wchar_t* id;
  } kinds[] = {
      {L"a.ali", MrcFile{}.Bytes(), L"210"},
      {L"a.ALI", MrcFile{}.Bytes(), L"210"},
      {L"a.rec", MrcFile{}.Bytes(), L"211"},
      {L"a.Rec", MrcFile{}.Bytes(), L"211"},
      {L"a.mrc", MrcFile{}.Bytes(), L"212"},
      {L"a.ser", ser.Bytes(), L"213"},
      {L"a.ebn", EbnFile{}.Bytes(), L"214"},
      {L"a.raw", RawFile{}.Bytes(), L"215"},
      {L"a.emi", OneImageEmiFile(0x2202, 1, 1, "x").Bytes(), L"101"},
  };
  const auto table = Answer("LoadStringW", &DescribingTable);
  for (const auto& kind : kinds) {
    const std::wstring tip = TipOf(Load(kind.name, kind.bytes));
    EXPECT_NE(tip.find(std::wstring(L"\r\nType: description ") + kind.id + L"\r\n"), std::wstring::npos)
        << kind.name;
  }
}

TEST_F(SystemAnswers, CommentOfAPropertyStoreIsTheDescription) {
  const struct {
    CLSID clsid;
    std::string bytes;
    const wchar_t* text;
  } kinds[] = {{kMrcHandlerClass, MrcFile{.labels = {"label"}}.Bytes(), L"description 212"},
               {kEbnHandlerClass, EbnFile{}.Bytes(), L"description 214"},
               {kRawHandlerClass, RawFile{}.Bytes(), L"description 215"}};
  const auto table = Answer("LoadStringW", &DescribingTable);
  for (const auto& [clsid, bytes, text] : kinds) {
    ScriptedStream stream(bytes);
    const auto store = dll_.CreateInstance<IPropertyStore>(clsid, IID_IPropertyStore);
    As<IInitializeWithStream>(store, IID_IInitializeWithStream)->Initialize(&stream, STGM_READ);
    PROPVARIANT value{};
    EXPECT_EQ(store->GetValue(kCommentsKey, &value), S_OK);
    EXPECT_EQ(TakeValue(value), Text(VT_LPWSTR, text));
  }
}

TEST_F(SystemAnswers, MissingStringsAreEmpty) {
  const auto table = Answer("LoadStringW", &EmptyTable);
  const auto attributes = Answer(
      "GetFileAttributesExW", +[](LPCWSTR, GET_FILEEX_INFO_LEVELS, LPVOID) -> BOOL WINAPI { return FALSE; });
  EXPECT_EQ(TipOf(Load(L"stack.mrc", MrcFile{.nz = 2}.Bytes())), L": 2  (1 \u00D7 1) 8 bit unsigned\r\n: ");
  SHCOLUMNINFO info{};
  EXPECT_EQ(As<IColumnProvider>(LoadImage(), IID_IColumnProvider)->GetColumnInfo(0, &info), S_OK);
  EXPECT_STREQ(info.wszTitle, L"");
}

/// Fills the buffer completely.
int WINAPI LongTexts(HINSTANCE, UINT, LPWSTR buffer, int room) {
  std::wmemset(buffer, L'x', static_cast<std::size_t>(room) - 1);
  buffer[room - 1] = L'\0';
  return room - 1;
}

TEST_F(SystemAnswers, TitleOfAColumnIsCutAt80CharactersWithItsTerminator) {
  const auto table = Answer("LoadStringW", &LongTexts);
  SHCOLUMNINFO info;
  std::memset(&info, 0x5A, sizeof info);
  EXPECT_EQ(As<IColumnProvider>(LoadImage(), IID_IColumnProvider)->GetColumnInfo(0, &info), S_OK);
  EXPECT_EQ(std::wstring(info.wszTitle), std::wstring(79, L'x'));
}

// The lines of a tip whose values come from the system.

constexpr wchar_t kFirstLines[] = L"Dimensions: (1 \u00D7 1) 8 bit unsigned\r\nType: ";
constexpr wchar_t kDateLine[] = L"\r\nDate Modified: date time";
constexpr wchar_t kSizeLine[] = L"\r\nSize: size";
constexpr wchar_t kCommentLine[] = L"\r\nlabel";

SYSTEMTIME g_shownDate;
SYSTEMTIME g_shownTime;
std::wstring g_date;
LONGLONG g_size;

BOOL WINAPI Attributes(LPCWSTR path, GET_FILEEX_INFO_LEVELS level, LPVOID answer) {
  EXPECT_EQ(std::filesystem::path(path).filename(), L"image.mrc");
  EXPECT_EQ(level, GetFileExInfoStandard);
  WIN32_FILE_ATTRIBUTE_DATA data{};
  SYSTEMTIME change{};
  change.wYear = 2021;
  change.wMonth = 3;
  change.wDay = 4;
  SystemTimeToFileTime(&change, &data.ftLastWriteTime);
  data.nFileSizeHigh = 7;
  data.nFileSizeLow = 0xFFFFFFF0;
  std::memcpy(answer, &data, sizeof data);
  return TRUE;
}
BOOL WINAPI LocalTime(const TIME_ZONE_INFORMATION* zone, LPSYSTEMTIME utc, LPSYSTEMTIME local) {
  EXPECT_EQ(zone, nullptr);
  EXPECT_EQ(utc->wYear, 2021);
  *local = *utc;
  local->wYear = 1987;
  return TRUE;
}
int WINAPI Date(LCID locale, DWORD flags, const SYSTEMTIME* time, LPCWSTR picture, LPWSTR text, int room) {
  EXPECT_EQ(locale, 0x400u);
  EXPECT_EQ(flags, 1u);
  EXPECT_EQ(picture, nullptr);
  EXPECT_EQ(room, 256);
  g_shownDate = *time;
  g_date.copy(text, g_date.size());
  text[g_date.size()] = L'\0';
  return static_cast<int>(g_date.size()) + 1;
}
int WINAPI Time(LCID locale, DWORD flags, const SYSTEMTIME* time, LPCWSTR picture, LPWSTR text, int room) {
  EXPECT_EQ(locale, 0x400u);
  EXPECT_EQ(flags, 2u);
  EXPECT_EQ(picture, nullptr);
  EXPECT_EQ(room, 256 - static_cast<int>(g_date.size()) - 1);
  g_shownTime = *time;
  if (room > 0) std::wcscpy(text, L"time");
  return 5;
}
LPWSTR WINAPI Size(LONGLONG size, LPWSTR text, UINT room) {
  EXPECT_EQ(room, 256u);
  g_size = size;
  return std::wcscpy(text, L"size");
}

class SystemLines : public SystemAnswers {
 protected:
  SystemLines() {
    g_date = L"date";
    g_size = 0;
  }

  Object object_ = LoadImage();

 private:
  ImportPatch attributes_ = Answer("GetFileAttributesExW", &Attributes);
  ImportPatch local_ = Answer("SystemTimeToTzSpecificLocalTime", &LocalTime);
  ImportPatch date_ = Answer("GetDateFormatW", &Date);
  ImportPatch time_ = Answer("GetTimeFormatW", &Time);
  ImportPatch size_ = Answer("StrFormatByteSizeW", &Size);
};

TEST_F(SystemLines, AreTheLocalTimeAndTheLowHalfOfTheSize) {
  EXPECT_EQ(TipOf(object_), std::wstring(kFirstLines) + kDateLine + kSizeLine + kCommentLine);
  EXPECT_EQ(g_shownDate.wYear, 1987);
  EXPECT_EQ(g_shownTime.wYear, 1987);
  EXPECT_EQ(g_shownDate.wDay, 4);
  EXPECT_EQ(g_size, 0xFFFFFFF0);
}

TEST_F(SystemLines, ShowUtcWhenTheLocalTimeIsUnknown) {
  const auto local = Answer(
      "SystemTimeToTzSpecificLocalTime",
      +[](const TIME_ZONE_INFORMATION*, LPSYSTEMTIME, LPSYSTEMTIME time) -> BOOL WINAPI {
        time->wYear = 1601;
        return FALSE;
      });
  EXPECT_EQ(TipOf(object_), std::wstring(kFirstLines) + kDateLine + kSizeLine + kCommentLine);
  EXPECT_EQ(g_shownDate.wYear, 2021);
  EXPECT_EQ(g_shownTime.wYear, 2021);
}

TEST_F(SystemLines, LeaveOutTheDateWhenAnyOfItsStepsFails) {
  const std::wstring expected = std::wstring(kFirstLines) + kSizeLine + kCommentLine;
  {
    const auto system =
        Answer("FileTimeToSystemTime", +[](const FILETIME*, LPSYSTEMTIME) -> BOOL WINAPI { return FALSE; });
    EXPECT_EQ(TipOf(object_), expected);
  }
  for (const char* const step : {"GetDateFormatW", "GetTimeFormatW"}) {
    const auto format =
        Answer(step, +[](LCID, DWORD, const SYSTEMTIME*, LPCWSTR, LPWSTR, int) -> int WINAPI { return 0; });
    EXPECT_EQ(TipOf(object_), expected) << step;
  }
}

TEST_F(SystemLines, ShowADateThatFillsItsBuffer) {
  g_date = std::wstring(255, L'd');
  EXPECT_EQ(TipOf(object_),
            std::wstring(kFirstLines) + L"\r\nDate Modified: " + g_date + L" " + kSizeLine + kCommentLine);
}

TEST_F(SystemLines, LeaveOutTheSizeWhenItCannotBeFormatted) {
  const auto size =
      Answer("StrFormatByteSizeW", +[](LONGLONG, LPWSTR, UINT) -> LPWSTR WINAPI { return nullptr; });
  EXPECT_EQ(TipOf(object_), std::wstring(kFirstLines) + kDateLine + kCommentLine);
}

TEST_F(SystemLines, AreLeftOutWhenTheFileIsNotVisible) {
  const auto attributes = Answer(
      "GetFileAttributesExW", +[](LPCWSTR, GET_FILEEX_INFO_LEVELS, LPVOID) -> BOOL WINAPI { return FALSE; });
  EXPECT_EQ(TipOf(object_), std::wstring(kFirstLines) + kCommentLine);
}

// A lack of memory for a tip.

/// The shell's allocator when it has no memory.
class ExhaustedAllocator final : public IMalloc {
 public:
  ULONG references = 1;
  SIZE_T wanted = 0;

  HRESULT STDMETHODCALLTYPE QueryInterface(REFIID, void** object) override {
    *object = nullptr;
    return E_NOINTERFACE;
  }
  ULONG STDMETHODCALLTYPE AddRef() override { return ++references; }
  ULONG STDMETHODCALLTYPE Release() override { return --references; }
  void* STDMETHODCALLTYPE Alloc(SIZE_T bytes) override {
    wanted = bytes;
    return nullptr;
  }
  void* STDMETHODCALLTYPE Realloc(void*, SIZE_T) override { return nullptr; }
  void STDMETHODCALLTYPE Free(void*) override {}
  SIZE_T STDMETHODCALLTYPE GetSize(void*) override { return 0; }
  int STDMETHODCALLTYPE DidAlloc(void*) override { return -1; }
  void STDMETHODCALLTYPE HeapMinimize() override {}
};

ExhaustedAllocator g_allocator;

TEST_F(SystemAnswers, TipNeedsAnAllocator) {
  const Object object = LoadImage();
  const auto none = Answer("SHGetMalloc", +[](IMalloc**) -> HRESULT WINAPI { return kFailure; });
  EXPECT_EQ(RefusedTip(object), kFailure);
  EXPECT_EQ(RefusedTip(Load(L"invalid.mrc", MrcFile{.nx = 0}.Bytes())), E_FAIL);
}

TEST_F(SystemAnswers, TipNeedsMemoryForItsTextAndItsTerminator) {
  const Object object = LoadImage();
  const std::size_t length = TipOf(object).size();
  const auto exhausted = Answer(
      "SHGetMalloc", +[](IMalloc** allocator) -> HRESULT WINAPI {
        g_allocator.AddRef();
        *allocator = &g_allocator;
        return S_OK;
      });
  EXPECT_EQ(RefusedTip(object), E_OUTOFMEMORY);
  EXPECT_EQ(g_allocator.wanted, (length + 1) * sizeof(wchar_t));
  EXPECT_EQ(g_allocator.references, 1u);
}

// A lack of memory for values.

BSTR WINAPI NoText(const OLECHAR*) {
  return nullptr;
}

TEST_F(SystemAnswers, ColumnsNeedMemoryForTheirStrings) {
  const auto file = folder_.Write(L"image.mrc", MrcFile{}.Bytes());
  const auto columns = dll_.CreateInstance<IColumnProvider>(kShellExtClass, IID_IColumnProvider);
  SHCOLUMNDATA item{};
  file.native().copy(item.wszFile, std::size(item.wszFile) - 1);
  const auto text = Answer("SysAllocString", &NoText);
  for (const PROPERTYKEY& key : {kDimensionsKey, kCommentsKey}) {
    VARIANT value{};
    value.vt = VT_I4;
    value.lVal = 7;
    EXPECT_EQ(columns->GetItemData(&key, &item, &value), E_OUTOFMEMORY);
    EXPECT_EQ(TakeValue(value), Number(VT_I4, 7));  // unchanged
  }
}

TEST_F(SystemAnswers, PropertySetsAreBuiltAgainAfterAFailure) {
  const auto sets = As<IPropertySetStorage>(LoadImage(), IID_IPropertySetStorage);
  const auto open = [&sets] {
    ComPtr<IPropertyStorage> storage;
    const HRESULT result = sets->Open(kImageSummary, STGM_READ, storage.Put());
    EXPECT_EQ(storage.Get() != nullptr, result == S_OK);
    return result;
  };
  {
    const auto text = Answer("SysAllocString", &NoText);
    EXPECT_EQ(open(), E_OUTOFMEMORY);
    ComPtr<IEnumSTATPROPSETSTG> list;
    EXPECT_EQ(sets->Enum(list.Put()), E_OUTOFMEMORY);
  }
  {
    const auto copy = Answer(
        "PropVariantCopy", +[](PROPVARIANT*, const PROPVARIANT*) -> HRESULT WINAPI { return kFailure; });
    EXPECT_EQ(open(), kFailure);
  }
  EXPECT_EQ(open(), S_OK);
}

TEST_F(SystemAnswers, ReadingAPropertyReturnsTheFailureOfItsCopy) {
  const auto sets = As<IPropertySetStorage>(LoadImage(), IID_IPropertySetStorage);
  ComPtr<IPropertyStorage> storage;
  ASSERT_EQ(sets->Open(kImageSummary, STGM_READ, storage.Put()), S_OK);
  PROPSPEC specifiers[2] = {};
  for (PROPSPEC& specifier : specifiers) {
    specifier.ulKind = PRSPEC_PROPID;
    specifier.propid = 3;
  }
  PROPVARIANT values[2] = {};
  const auto copy =
      Answer("PropVariantCopy", +[](PROPVARIANT*, const PROPVARIANT*) -> HRESULT WINAPI { return kFailure; });
  EXPECT_EQ(storage->ReadMultiple(2, specifiers, values), kFailure);
}

int g_copies = 0;

HRESULT WINAPI FailFirstCopy(PROPVARIANT* to, const PROPVARIANT* from) {
  return ++g_copies == 1 ? kFailure : PropVariantCopy(to, from);
}

TEST_F(SystemAnswers, ReadingPropertiesStopsAtTheFirstCopyThatFails) {
  const auto sets = As<IPropertySetStorage>(LoadImage(), IID_IPropertySetStorage);
  ComPtr<IPropertyStorage> storage;
  ASSERT_EQ(sets->Open(kImageSummary, STGM_READ, storage.Put()), S_OK);
  PROPSPEC specifiers[2] = {};
  for (PROPSPEC& specifier : specifiers) {
    specifier.ulKind = PRSPEC_PROPID;
    specifier.propid = 3;
  }
  PROPVARIANT values[2] = {};
  const auto copy = Answer("PropVariantCopy", &FailFirstCopy);
  EXPECT_EQ(storage->ReadMultiple(2, specifiers, values), kFailure);
  EXPECT_EQ(g_copies, 1);
  EXPECT_EQ(TakeValue(values[1]), Value());
}

TEST_F(SystemAnswers, EnumeratorIsNullWithoutMemory) {
  const auto sets = As<IPropertySetStorage>(LoadImage(), IID_IPropertySetStorage);
  ComPtr<IPropertyStorage> storage;
  ASSERT_EQ(sets->Open(kImageSummary, STGM_READ, storage.Put()), S_OK);
  const auto memory = Answer("malloc", +[](std::size_t) -> void* { return nullptr; });
  int place = 0;
  auto* properties = reinterpret_cast<IEnumSTATPROPSTG*>(&place);
  EXPECT_EQ(storage->Enum(&properties), E_OUTOFMEMORY);
  EXPECT_EQ(properties, nullptr);
  auto* list = reinterpret_cast<IEnumSTATPROPSETSTG*>(&place);
  EXPECT_EQ(sets->Enum(&list), E_OUTOFMEMORY);
  EXPECT_EQ(list, nullptr);
}

TEST_F(SystemAnswers, PropertyStoreGivesAnEmptyValueWithoutMemoryForAString) {
  ScriptedStream stream(MrcFile{}.Bytes());
  const auto store = dll_.CreateInstance<IPropertyStore>(kMrcHandlerClass, IID_IPropertyStore);
  As<IInitializeWithStream>(store, IID_IInitializeWithStream)->Initialize(&stream, STGM_READ);
  const auto text = Answer("SHStrDupW", +[](LPCWSTR, LPWSTR*) -> HRESULT WINAPI { return kFailure; });
  for (const PROPERTYKEY& key : {kDimensionsKey, kCommentsKey}) {
    PROPVARIANT value;
    std::memset(&value, 0x5A, sizeof value);
    EXPECT_EQ(store->GetValue(key, &value), kFailure);
    const char zeros[sizeof value] = {};
    EXPECT_EQ(std::memcmp(&value, zeros, sizeof value), 0);
  }
}

// A bitmap that cannot be created.

struct BitmapRequest {
  BITMAPINFOHEADER header;
  std::vector<RGBQUAD> colours;
};

std::vector<BitmapRequest> g_bitmaps;

HBITMAP WINAPI NoBitmap(HDC dc, const BITMAPINFO* info, UINT usage, void** bits, HANDLE section,
                        DWORD offset) {
  EXPECT_NE(dc, nullptr);
  EXPECT_EQ(usage, UINT{DIB_RGB_COLORS});
  EXPECT_EQ(section, nullptr);
  EXPECT_EQ(offset, 0u);
  EXPECT_NE(bits, nullptr);
  g_bitmaps.push_back({info->bmiHeader, {info->bmiColors, info->bmiColors + info->bmiHeader.biClrUsed}});
  return nullptr;
}

TEST_F(SystemAnswers, ThereIsNoThumbnailWhenTheBitmapCannotBeCreated) {
  const MrcFile grey{.nx = 5, .ny = 3, .pixels = std::string(15, 'p')};
  const MrcFile colour{.nx = 5, .ny = 3, .mode = 16, .pixels = std::string(45, 'p')};
  const auto none = Answer("CreateDIBSection", &NoBitmap);
  g_bitmaps.clear();
  for (const MrcFile& file : {grey, colour}) {
    const auto image = As<IExtractImage>(Load(L"image.mrc", file.Bytes()), IID_IExtractImage);
    const SIZE size{5, 3};
    DWORD flags = 0;
    EXPECT_EQ(image->GetLocation(nullptr, 0, nullptr, &size, 24, &flags), S_OK);
    auto bitmap = reinterpret_cast<HBITMAP>(0x1234);
    EXPECT_EQ(image->Extract(&bitmap), E_FAIL);
    EXPECT_EQ(bitmap, nullptr);
  }

  ASSERT_EQ(g_bitmaps.size(), 2u);
  for (const BitmapRequest& request : g_bitmaps) {
    EXPECT_EQ(request.header.biSize, 40u);
    EXPECT_EQ(request.header.biWidth, 5);
    EXPECT_EQ(request.header.biHeight, -3);
    EXPECT_EQ(request.header.biPlanes, 1);
    EXPECT_EQ(request.header.biCompression, DWORD{BI_RGB});
    EXPECT_EQ(request.header.biXPelsPerMeter, 1200);
    EXPECT_EQ(request.header.biYPelsPerMeter, 1200);
    EXPECT_EQ(request.header.biClrImportant, 0u);
  }
  EXPECT_EQ(g_bitmaps[0].header.biBitCount, 8);
  EXPECT_EQ(g_bitmaps[0].header.biSizeImage, 2u * 8u + 5u);
  ASSERT_EQ(g_bitmaps[0].colours.size(), 256u);
  for (unsigned i = 0; i < 256; ++i) {
    const RGBQUAD& entry = g_bitmaps[0].colours[i];
    EXPECT_EQ(entry.rgbBlue, i);
    EXPECT_EQ(entry.rgbGreen, i);
    EXPECT_EQ(entry.rgbRed, i);
    EXPECT_EQ(entry.rgbReserved, 0);
  }
  EXPECT_EQ(g_bitmaps[1].header.biBitCount, 24);
  EXPECT_EQ(g_bitmaps[1].header.biSizeImage, 2u * 16u + 15u);
  EXPECT_TRUE(g_bitmaps[1].colours.empty());
}

}  // namespace
}  // namespace Qel::Lumetra::ShellExt::Testing
