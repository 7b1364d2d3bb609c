// Tests the columns of the Details view.
#include <gtest/gtest.h>
#include <windows.h>

#include <shlobj.h>

#include <cstring>
#include <filesystem>
#include <stdexcept>
#include <string>

#include "ebn_file.h"
#include "emi_file.h"
#include "mrc_file.h"
#include "raw_file.h"
#include "ser_file.h"
#include "server_dll.h"
#include "shell_values.h"
#include "temp_folder.h"
#include "unused_file.h"

namespace Qel::Lumetra::ShellExt::Testing {
namespace {

class Columns : public ServerTest {
 protected:
  TempFolder folder_;
  ComPtr<IColumnProvider> provider_ =
      dll_.CreateInstance<IColumnProvider>(kShellExtClass, IID_IColumnProvider);

  HRESULT GetData(const std::filesystem::path& file, const PROPERTYKEY& column, VARIANT* value) {
    SHCOLUMNDATA item{};
    file.native().copy(item.wszFile, std::size(item.wszFile) - 1);
    return provider_->GetItemData(&column, &item, value);
  }

  /// Returns the value of a column that has one.
  Value Read(const std::filesystem::path& file, const PROPERTYKEY& column) {
    VARIANT value{};
    EXPECT_EQ(GetData(file, column, &value), S_OK);
    return TakeValue(value);
  }

  /// Expects S_FALSE and an unchanged result.
  void ExpectNone(const std::filesystem::path& file, const PROPERTYKEY& column) {
    VARIANT value{};
    value.vt = VT_I4;
    value.lVal = 77;
    EXPECT_EQ(GetData(file, column, &value), S_FALSE);
    EXPECT_EQ(TakeValue(value), Number(VT_I4, 77));
  }
};

TEST_F(Columns, ThereAreSix) {
  const struct {
    PROPERTYKEY key;
    VARTYPE type;
    UINT characters;
    DWORD state;
    const wchar_t* title;
  } columns[] = {{kWidthKey, VT_I4, 5, 0x101, L"Width"},
                 {kHeightKey, VT_I4, 5, 0x101, L"Height"},
                 {kBitDepthKey, VT_UI4, 5, 0x1, L"Bit Depth"},
                 {kFrameCountKey, VT_UI4, 5, 0x1, L"Frame Count"},
                 {kDimensionsKey, VT_LPWSTR, 20, 0x11, L"Dimensions"},
                 {kCommentsKey, VT_LPWSTR, 30, 0x11, L"Comments"}};
  for (DWORD i = 0; i < std::size(columns); ++i) {
    SHCOLUMNINFO info;
    std::memset(&info, 0x5A, sizeof info);
    ASSERT_EQ(provider_->GetColumnInfo(i, &info), S_OK);
    const PROPERTYKEY key = info.scid;
    EXPECT_TRUE(IsEqualPropertyKey(key, columns[i].key)) << i;
    EXPECT_EQ(VARTYPE{info.vt}, columns[i].type) << i;
    EXPECT_EQ(DWORD{info.fmt}, 0u) << i;
    EXPECT_EQ(UINT{info.cChars}, columns[i].characters) << i;
    EXPECT_EQ(DWORD{info.csFlags}, columns[i].state) << i;
    EXPECT_STREQ(info.wszTitle, columns[i].title);
    EXPECT_STREQ(info.wszDescription, L"");
  }
}

TEST_F(Columns, EndAfterTheSixth) {
  for (const DWORD index : {DWORD{6}, DWORD{7}, DWORD{0x80000000}, DWORD{0xFFFFFFFF}}) {
    SHCOLUMNINFO info;
    SHCOLUMNINFO untouched;
    std::memset(&info, 0x5A, sizeof info);
    std::memset(&untouched, 0x5A, sizeof untouched);
    EXPECT_EQ(provider_->GetColumnInfo(index, &info), S_FALSE);
    EXPECT_EQ(std::memcmp(&info, &untouched, sizeof info), 0);
  }
}

TEST_F(Columns, AcceptAnyFolder) {
  const SHCOLUMNINIT init{};
  EXPECT_EQ(provider_->Initialize(&init), S_OK);
  EXPECT_EQ(provider_->Initialize(nullptr), S_OK);
}

TEST_F(Columns, OfMrc) {
  const auto file = folder_.Write(
      L"stack.mrc", MrcFile{.nx = 512, .ny = 256, .nz = 61, .mode = 1, .labels = {"one", "two"}}.Bytes());
  EXPECT_EQ(Read(file, kWidthKey), Number(VT_I4, 512));
  EXPECT_EQ(Read(file, kHeightKey), Number(VT_I4, 256));
  EXPECT_EQ(Read(file, kBitDepthKey), Number(VT_I4, 16));
  EXPECT_EQ(Read(file, kFrameCountKey), Number(VT_I4, 61));
  EXPECT_EQ(Read(file, kDimensionsKey), Text(VT_BSTR, L"512 x 256"));
  EXPECT_EQ(Read(file, kCommentsKey), Text(VT_BSTR, L"one\r\ntwo"));
}

TEST_F(Columns, OfRaw) {
  const auto file =
      folder_.Write(L"image.raw", PackedRawFile(DataType::kUInt16, 6, 4, std::string(48, 'p')).Bytes());
  EXPECT_EQ(Read(file, kWidthKey), Number(VT_I4, 6));
  EXPECT_EQ(Read(file, kHeightKey), Number(VT_I4, 4));
  EXPECT_EQ(Read(file, kBitDepthKey), Number(VT_I4, 16));
  EXPECT_EQ(Read(file, kFrameCountKey), Number(VT_I4, 1));
  EXPECT_EQ(Read(file, kDimensionsKey), Text(VT_BSTR, L"6 x 4"));
  EXPECT_EQ(Read(file, kCommentsKey), Text(VT_BSTR, L""));
}

TEST_F(Columns, GiveNegativeNumbersUnchanged) {
  const auto file = folder_.Write(L"negative.raw", RawFile{.width = -2}.Bytes());
  EXPECT_EQ(Read(file, kWidthKey), Number(VT_I4, -2));
}

TEST_F(Columns, OfEbn) {
  const EbnFile ebn{.typeCode = 8, .width = 3, .height = 2, .model = 1, .source = 1, .kilovolts = 200};
  const auto file = folder_.Write(L"image.ebn", ebn.Bytes());
  EXPECT_EQ(Read(file, kWidthKey), Number(VT_I4, 3));
  EXPECT_EQ(Read(file, kHeightKey), Number(VT_I4, 2));
  EXPECT_EQ(Read(file, kBitDepthKey), Number(VT_I4, 64));
  EXPECT_EQ(Read(file, kFrameCountKey), Number(VT_I4, 1));
  EXPECT_EQ(Read(file, kDimensionsKey), Text(VT_BSTR, L"3 x 2"));
  EXPECT_EQ(Read(file, kCommentsKey), Text(VT_BSTR, L"Halden 20 FEG 200.0 kV"));
}

TEST_F(Columns, OfSer) {
  SerFile ser;
  ser.elements.assign(3, SerElement{.width = 2, .height = 4, .pixels = std::string(8, 'p')});
  const auto file = folder_.Write(L"series.ser", ser.Bytes());
  EXPECT_EQ(Read(file, kWidthKey), Number(VT_I4, 2));
  EXPECT_EQ(Read(file, kHeightKey), Number(VT_I4, 4));
  EXPECT_EQ(Read(file, kBitDepthKey), Number(VT_I4, 8));
  EXPECT_EQ(Read(file, kFrameCountKey), Number(VT_I4, 3));
  EXPECT_EQ(Read(file, kDimensionsKey), Text(VT_BSTR, L"2 x 4"));
  EXPECT_EQ(Read(file, kCommentsKey), Text(VT_BSTR, L""));
}

TEST_F(Columns, OfEmi) {
  const auto file = folder_.Write(L"image.emi", OneImageEmiFile(0x2204, 2, 2, std::string(8, 'p')).Bytes());
  EXPECT_EQ(Read(file, kWidthKey), Number(VT_I4, 2));
  EXPECT_EQ(Read(file, kHeightKey), Number(VT_I4, 2));
  EXPECT_EQ(Read(file, kBitDepthKey), Number(VT_I4, 16));
  EXPECT_EQ(Read(file, kFrameCountKey), Number(VT_I4, 1));
  EXPECT_EQ(Read(file, kDimensionsKey), Text(VT_BSTR, L"2 x 2"));
  EXPECT_EQ(Read(file, kCommentsKey), Text(VT_BSTR, L"VRA EMI File"));
}

TEST_F(Columns, GiveTheSizeInPixelsAsTheResolution) {
  const auto file = folder_.Write(L"image.mrc", MrcFile{.nx = 512, .ny = 256}.Bytes());
  EXPECT_EQ(Read(file, {kImageSummary, 5}), Number(VT_I4, 512));
  EXPECT_EQ(Read(file, {kImageSummary, 6}), Number(VT_I4, 256));
}

TEST_F(Columns, HaveNoOtherProperties) {
  const auto file = folder_.Write(L"image.mrc", MrcFile{}.Bytes());
  for (const PROPID id : {0u, 1u, 2u, 8u, 9u, 10u, 11u, 14u, 0xFFFFFFFFu}) {
    ExpectNone(file, {kImageSummary, id});
  }
  for (const PROPID id : {0u, 2u, 3u, 4u, 5u, 7u, 12u, 13u}) ExpectNone(file, {kSummary, id});
  for (const PROPID id : {3u, 6u, 13u}) ExpectNone(file, {kOtherSet, id});
}

TEST_F(Columns, AreEmptyForAnUnknownExtension) {
  for (const wchar_t* const name : {L"image.mrc2", L"image.tif", L"image", L"image."}) {
    const auto file = folder_.Write(name, MrcFile{}.Bytes());
    for (const PROPERTYKEY& key : kAllKeys) ExpectNone(file, key);
  }
}

TEST_F(Columns, AreEmptyForAFileThatIsNotValid) {
  const auto file = folder_.Write(L"image.mrc", MrcFile{.nx = 0}.Bytes());
  const auto empty = folder_.Write(L"image.raw", "");
  for (const PROPERTYKEY& key : kAllKeys) {
    ExpectNone(file, key);
    ExpectNone(empty, key);
  }
}

TEST_F(Columns, AreEmptyForAMissingFile) {
  for (const PROPERTYKEY& key : kAllKeys) {
    ExpectNone(L"C:\\no such folder\\image.mrc", key);
    ExpectNone(L"", key);
  }
}

TEST_F(Columns, NeedNoLoadedFileAndIgnoreOne) {
  const auto loaded = folder_.Write(L"loaded.mrc", MrcFile{.nx = 8, .ny = 8}.Bytes());
  const auto asked = folder_.Write(L"asked.mrc", MrcFile{.nx = 5, .ny = 3}.Bytes());
  EXPECT_EQ(Read(asked, kDimensionsKey), Text(VT_BSTR, L"5 x 3"));
  EXPECT_EQ(As<IPersistFile>(provider_, IID_IPersistFile)->Load(loaded.c_str(), STGM_READ), S_OK);
  EXPECT_EQ(Read(asked, kDimensionsKey), Text(VT_BSTR, L"5 x 3"));
}

TEST_F(Columns, OpenTheFileInEveryCall) {
  const auto file = folder_.Write(L"image.mrc", MrcFile{.nx = 5, .ny = 3}.Bytes());
  EXPECT_EQ(Read(file, kWidthKey), Number(VT_I4, 5));
  folder_.Write(L"image.mrc", MrcFile{.nx = 6, .ny = 3}.Bytes());
  EXPECT_EQ(Read(file, kWidthKey), Number(VT_I4, 6));
}

TEST_F(Columns, LeaveTheFileClosed) {
  const auto file = folder_.Write(L"image.mrc", MrcFile{}.Bytes());
  Read(file, kWidthKey);
  ExpectNone(file, {kImageSummary, 8});
  EXPECT_TRUE(IsUnused(file));
}

TEST_F(Columns, ReadAFileThatAnotherProgramIsWriting) {
  const auto file = folder_.Write(L"image.mrc", MrcFile{.nx = 5}.Bytes());
  const HANDLE writer =
      CreateFileW(file.c_str(), GENERIC_READ | GENERIC_WRITE,
                  FILE_SHARE_READ | FILE_SHARE_WRITE | FILE_SHARE_DELETE, nullptr, OPEN_EXISTING, 0, nullptr);
  ASSERT_NE(writer, INVALID_HANDLE_VALUE);
  EXPECT_EQ(Read(file, kWidthKey), Number(VT_I4, 5));
  CloseHandle(writer);
}

TEST_F(Columns, ReplaceThePreviousResult) {
  const auto file = folder_.Write(L"image.mrc", MrcFile{.nx = 5}.Bytes());
  VARIANT value{};
  value.vt = VT_BSTR;
  value.bstrVal = SysAllocString(L"before");
  EXPECT_EQ(GetData(file, kWidthKey, &value), S_OK);
  EXPECT_EQ(TakeValue(value), Number(VT_I4, 5));
}

TEST_F(Columns, ReportAResultThatCannotBeCleared) {
  const auto file = folder_.Write(L"image.mrc", MrcFile{.nx = 5}.Bytes());
  VARIANT value{};
  value.vt = 0x7777;
  const HRESULT refused = VariantClear(&value);
  ASSERT_TRUE(FAILED(refused));
  for (const PROPERTYKEY& key : kAllKeys) EXPECT_EQ(GetData(file, key, &value), refused);
  EXPECT_EQ(value.vt, 0x7777);
}

TEST_F(Columns, NeedAnOutputPointerForAnAnswerOnly) {
  const auto file = folder_.Write(L"image.mrc", MrcFile{}.Bytes());
  for (const PROPERTYKEY& key : kAllKeys) EXPECT_EQ(GetData(file, key, nullptr), E_POINTER);
  EXPECT_EQ(GetData(file, {kImageSummary, 8}, nullptr), S_FALSE);
  EXPECT_EQ(GetData(L"C:\\no such folder\\image.mrc", kWidthKey, nullptr), S_FALSE);
}

TEST_F(Columns, SurviveNullArguments) {
  const SHCOLUMNDATA item{};
  VARIANT value{};
  EXPECT_EQ(provider_->GetColumnInfo(0, nullptr), E_POINTER);
  EXPECT_EQ(provider_->GetColumnInfo(6, nullptr), S_FALSE);
  EXPECT_EQ(provider_->GetItemData(nullptr, &item, &value), E_POINTER);
  EXPECT_EQ(provider_->GetItemData(&kWidthKey, nullptr, &value), E_POINTER);
  // The answer for a property of another set does not depend on the file.
  const PROPERTYKEY other{kOtherSet, 3};
  EXPECT_EQ(provider_->GetItemData(&other, nullptr, nullptr), S_FALSE);
}

TEST_F(Columns, ReadAPathThatFillsItsArrayWithoutATerminator) {
  SHCOLUMNDATA item;
  std::memset(&item, 0x5A, sizeof item);  // the fields after the path too
  std::wstring path = L"\\\\?\\" + folder_.path().wstring() + L"\\";
  path.append(std::size(item.wszFile) - path.size() - 4, L'x').append(L".mrc");
  ASSERT_EQ(path.copy(item.wszFile, std::wstring::npos), std::size(item.wszFile));
  const std::string bytes = MrcFile{.nx = 5}.Bytes();
  {
    const HANDLE file = CreateFileW(path.c_str(), GENERIC_WRITE, 0, nullptr, CREATE_NEW, 0, nullptr);
    ASSERT_NE(file, INVALID_HANDLE_VALUE);
    DWORD written = 0;
    EXPECT_TRUE(WriteFile(file, bytes.data(), static_cast<DWORD>(bytes.size()), &written, nullptr));
    CloseHandle(file);
  }
  VARIANT value{};
  EXPECT_EQ(provider_->GetItemData(&kWidthKey, &item, &value), S_OK);
  EXPECT_EQ(TakeValue(value), Number(VT_I4, 5));
  DeleteFileW(path.c_str());
}

TEST_F(Columns, LetAReadersExceptionsThroughAndCloseTheFile) {
  // The parser throws because of a string outside every object.
  const auto emi = folder_.Write(L"image.emi", EmiFile{.items = EmiText(0x0100, "text") + EmiEnd()}.Bytes());
  VARIANT value{};
  EXPECT_THROW(GetData(emi, kWidthKey, &value), std::invalid_argument);
  EXPECT_TRUE(IsUnused(emi));

  SerFile bytes;
  bytes.elements.assign(1, SerElement{.pixels = "p"});
  bytes.dimensions[0].descriptionLength = -1;
  const auto ser = folder_.Write(L"series.ser", bytes.Bytes());
  EXPECT_THROW(GetData(ser, kWidthKey, &value), std::length_error);
  EXPECT_TRUE(IsUnused(ser));
  EXPECT_EQ(TakeValue(value), Value());
}

}  // namespace
}  // namespace Qel::Lumetra::ShellExt::Testing
