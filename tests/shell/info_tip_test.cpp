// Tests the info tip.
#include <gtest/gtest.h>
#include <windows.h>

#include <shlobj.h>
#include <shlwapi.h>

#include <array>
#include <filesystem>
#include <fstream>
#include <stdexcept>
#include <string>

#include "ebn_file.h"
#include "emi_file.h"
#include "mrc_file.h"
#include "raw_file.h"
#include "ser_file.h"
#include "server_dll.h"
#include "temp_folder.h"

namespace Qel::Lumetra::ShellExt::Testing {
namespace {

class InfoTip : public ServerTest {
 protected:
  using Object = ComPtr<IQueryInfo>;

  Object Make() { return dll_.CreateInstance<IQueryInfo>(kShellExtClass, IID_IQueryInfo); }

  Object Load(const std::filesystem::path& file) {
    Object object = Make();
    EXPECT_EQ(As<IPersistFile>(object, IID_IPersistFile)->Load(file.c_str(), STGM_READ), S_OK);
    return object;
  }

  static std::wstring TipOf(const Object& object) {
    wchar_t* tip = nullptr;
    EXPECT_EQ(object->GetInfoTip(QITIPF_DEFAULT, &tip), S_OK);
    if (tip == nullptr) return L"<none>";
    std::wstring text = tip;
    CoTaskMemFree(tip);
    return text;
  }

  /// Returns the tip of a file that has been renamed after Load, so that the tip shows only what its contents
  /// say.
  std::wstring TipOfContents(const std::filesystem::path& name, const std::string& bytes) {
    const std::filesystem::path file = folder_.Write(name, bytes);
    const Object object = Load(file);
    std::filesystem::rename(file, folder_.path() / L"elsewhere");
    return TipOf(object);
  }

  /// Returns the result of GetInfoTip for an object without a valid file. The output pointer must not change.
  static HRESULT Refusal(const Object& object) {
    wchar_t untouched[] = L"untouched";
    wchar_t* tip = untouched;
    const HRESULT result = object->GetInfoTip(QITIPF_DEFAULT, &tip);
    EXPECT_EQ(tip, untouched);
    return result;
  }

  TempFolder folder_;
};

std::wstring SizeText(LONGLONG bytes) {
  std::array<wchar_t, 64> text{};
  StrFormatByteSizeW(bytes, text.data(), static_cast<UINT>(text.size()));
  return text.data();
}

/// Sets the time of the file's last change, in UTC. Returns it in the user's format and time zone.
std::wstring SetChangeTime(const std::filesystem::path& file, WORD year, WORD month, WORD day, WORD hour,
                           WORD minute) {
  SYSTEMTIME utc{};
  utc.wYear = year;
  utc.wMonth = month;
  utc.wDay = day;
  utc.wHour = hour;
  utc.wMinute = minute;
  FILETIME time{};
  EXPECT_TRUE(SystemTimeToFileTime(&utc, &time));
  const HANDLE handle =
      CreateFileW(file.c_str(), FILE_WRITE_ATTRIBUTES, FILE_SHARE_READ, nullptr, OPEN_EXISTING, 0, nullptr);
  EXPECT_TRUE(SetFileTime(handle, nullptr, nullptr, &time));
  CloseHandle(handle);

  SYSTEMTIME local{};
  EXPECT_TRUE(SystemTimeToTzSpecificLocalTime(nullptr, &utc, &local));
  std::array<wchar_t, 100> date{};
  std::array<wchar_t, 100> clock{};
  GetDateFormatEx(LOCALE_NAME_USER_DEFAULT, DATE_SHORTDATE, &local, nullptr, date.data(), 100, nullptr);
  GetTimeFormatEx(LOCALE_NAME_USER_DEFAULT, TIME_NOSECONDS, &local, nullptr, clock.data(), 100);
  return std::wstring(date.data()) + L" " + clock.data();
}

TEST_F(InfoTip, HasAllItsLinesInOrder) {
  const auto file = folder_.Write(
      L"stack.mrc",
      MrcFile{.nx = 4096, .ny = 2048, .nz = 61, .mode = 1, .labels = {"first", "second"}}.Bytes());
  const std::wstring time = SetChangeTime(file, 2021, 3, 4, 15, 6);
  EXPECT_EQ(TipOf(Load(file)),
            L"Dimensions: 61 images (4096 \u00D7 2048) 16 bit signed\r\n"
            L"Type: \r\n"
            L"Date Modified: " +
                time +
                L"\r\n"
                L"Size: " +
                SizeText(1024) +
                L"\r\n"
                L"first\r\nsecond");
}

TEST_F(InfoTip, EndsWithTheSizeWithoutAComment) {
  const auto file = folder_.Write(L"image.mrc", MrcFile{.nx = 2, .ny = 3, .mode = 2}.Bytes());
  const std::wstring time = SetChangeTime(file, 1999, 12, 31, 23, 59);
  EXPECT_EQ(TipOf(Load(file)),
            L"Dimensions: (2 \u00D7 3) 32 bit float\r\n"
            L"Type: \r\n"
            L"Date Modified: " +
                time +
                L"\r\n"
                L"Size: " +
                SizeText(1024));
}

TEST_F(InfoTip, CountsTheImagesOfAStackOnly) {
  EXPECT_EQ(TipOfContents(L"one.mrc", MrcFile{.nz = 1}.Bytes()),
            L"Dimensions: (1 \u00D7 1) 8 bit unsigned\r\nType: ");
  EXPECT_EQ(TipOfContents(L"two.mrc", MrcFile{.nz = 2}.Bytes()),
            L"Dimensions: 2 images (1 \u00D7 1) 8 bit unsigned\r\nType: ");
  EXPECT_EQ(TipOfContents(L"many.mrc", MrcFile{.nz = 1234567}.Bytes()),
            L"Dimensions: 1234567 images (1 \u00D7 1) 8 bit unsigned\r\nType: ");
}

TEST_F(InfoTip, ShowsTheContentsOfEveryKind) {
  EXPECT_EQ(TipOfContents(L"stack.ali", MrcFile{.nx = 5, .labels = {"tilt"}}.Bytes()),
            L"Dimensions: (5 \u00D7 1) 8 bit unsigned\r\nType: \r\ntilt");
  EXPECT_EQ(TipOfContents(L"volume.REC", MrcFile{.ny = 5, .mode = 16}.Bytes()),
            L"Dimensions: (1 \u00D7 5) 24 bit RGB\r\nType: ");
  EXPECT_EQ(TipOfContents(L"image.raw", PackedRawFile(DataType::kInt32, 2, 1, std::string(8, 'p')).Bytes()),
            L"Dimensions: (2 \u00D7 1) 32 bit signed\r\nType: ");
  EXPECT_EQ(
      TipOfContents(L"image.ebn", EbnFile{.width = 7, .model = 1, .source = 1, .kilovolts = 200}.Bytes()),
      L"Dimensions: (7 \u00D7 1) 8 bit unsigned\r\nType: \r\nHalden 20 FEG 200.0 kV");
  SerFile ser;
  ser.elements.assign(3, SerElement{.width = 2, .height = 1, .pixels = "pp"});
  EXPECT_EQ(TipOfContents(L"series.ser", ser.Bytes()),
            L"Dimensions: 3 images (2 \u00D7 1) 8 bit unsigned\r\nType: ");
  EXPECT_EQ(TipOfContents(L"image.emi", OneImageEmiFile(0x2204, 2, 2, std::string(8, 'p')).Bytes()),
            L"Dimensions: (2 \u00D7 2) 16 bit signed\r\nType: \r\nVRA EMI File");
}

TEST_F(InfoTip, ShowsACommentUnchanged) {
  EXPECT_EQ(TipOfContents(L"image.mrc", MrcFile{.labels = {"  a\tb\xE9", "%s {0}"}}.Bytes()),
            L"Dimensions: (1 \u00D7 1) 8 bit unsigned\r\nType: \r\n  a\tb\xFFE9\r\n%s {0}");
}

TEST_F(InfoTip, LeavesOutTheFileSystemsLinesForADeletedFile) {
  const auto file = folder_.Write(L"image.mrc", MrcFile{.labels = {"label"}}.Bytes());
  const Object object = Load(file);
  ASSERT_TRUE(DeleteFileW(file.c_str()));
  const std::wstring tip = TipOf(object);
  // The file remains visible in its folder until its last handle is closed.
  if (GetFileAttributesW(file.c_str()) == INVALID_FILE_ATTRIBUTES) {
    EXPECT_EQ(tip, L"Dimensions: (1 \u00D7 1) 8 bit unsigned\r\nType: \r\nlabel");
  } else {
    EXPECT_NE(tip.find(L"Size: "), std::wstring::npos);
  }
}

TEST_F(InfoTip, ShowsTheSizeModulo4GiB) {
  const auto file = folder_.Write(L"large.mrc", MrcFile{}.Bytes());
  for (const std::uintmax_t size : {(std::uintmax_t{1} << 32) + 1024, (std::uintmax_t{5} << 32) + 7777,
                                    (std::uintmax_t{1} << 32) - 1024}) {
    Lengthen(file, size);
    const std::wstring tip = TipOf(Load(file));
    const std::wstring line = L"\r\nSize: " + SizeText(static_cast<LONGLONG>(size & 0xFFFFFFFF));
    ASSERT_GE(tip.size(), line.size());
    EXPECT_EQ(tip.substr(tip.size() - line.size()), line);
  }
}

TEST_F(InfoTip, IsTheSameForAllFlagsAndInEveryCall) {
  const auto file = folder_.Write(L"image.mrc", MrcFile{}.Bytes());
  const Object object = Load(file);
  const std::wstring expected = TipOf(object);
  for (const DWORD flags : {DWORD{QITIPF_USENAME}, DWORD{0xFFFFFFFF}}) {
    wchar_t* tip = nullptr;
    EXPECT_EQ(object->GetInfoTip(flags, &tip), S_OK);
    EXPECT_EQ(tip, expected);
    CoTaskMemFree(tip);
  }
}

TEST_F(InfoTip, IsRefusedWithoutAValidFile) {
  EXPECT_EQ(Refusal(Make()), E_FAIL);
  EXPECT_EQ(Refusal(Load(folder_.path() / L"missing.mrc")), E_FAIL);
  EXPECT_EQ(Refusal(Load(folder_.Write(L"invalid.mrc", MrcFile{.nx = 0}.Bytes()))), E_FAIL);
  EXPECT_EQ(Refusal(Load(folder_.Write(L"unknown.tif", MrcFile{}.Bytes()))), E_FAIL);
}

TEST_F(InfoTip, IsRefusedWhenTheReaderHasThrown) {
  const auto file = folder_.Write(L"image.emi", EmiFile{.items = EmiText(0x0100, "text") + EmiEnd()}.Bytes());
  const Object object = Make();
  EXPECT_THROW(As<IPersistFile>(object, IID_IPersistFile)->Load(file.c_str(), STGM_READ),
               std::invalid_argument);
  EXPECT_EQ(Refusal(object), E_FAIL);
}

TEST_F(InfoTip, RejectsNullOutputPointers) {
  const Object object = Load(folder_.Write(L"image.mrc", MrcFile{}.Bytes()));
  EXPECT_EQ(object->GetInfoTip(QITIPF_DEFAULT, nullptr), E_POINTER);
  EXPECT_EQ(object->GetInfoFlags(nullptr), E_POINTER);
}

TEST_F(InfoTip, HasNoFlags) {
  for (const Object& object : {Make(), Load(folder_.Write(L"image.mrc", MrcFile{}.Bytes()))}) {
    DWORD flags = 77;
    EXPECT_EQ(object->GetInfoFlags(&flags), S_OK);
    EXPECT_EQ(flags, 0u);
  }
}

}  // namespace
}  // namespace Qel::Lumetra::ShellExt::Testing
