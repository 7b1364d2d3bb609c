#include "file_type_factory.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <array>
#include <functional>
#include <sstream>
#include <stdexcept>

#include "ebn_file.h"
#include "emi_file.h"
#include "file_kinds.h"
#include "image_file_info.h"
#include "mrc_file.h"
#include "raw_file.h"
#include "ser_file.h"

namespace Qel::Lumetra::ShellExt {
namespace {

/// Returns whether the factory makes a `Reader` for `path`, on a stream of `bytes`.
template <class Reader>
bool Makes(const std::wstring& path, const std::string& bytes = {}) {
  std::istringstream stream(bytes);
  const auto reader = CreateFileTypeInfo(stream, GetExtension(path));
  return dynamic_cast<const Reader*>(reader.get()) != nullptr;
}

bool MakesNone(const std::wstring& path) {
  std::istringstream stream;
  return CreateFileTypeInfo(stream, GetExtension(path)) == nullptr;
}

TEST(GetExtension, IsWhatFollowsTheLastDot) {
  EXPECT_EQ(GetExtension(L""), L"");
  EXPECT_EQ(GetExtension(L"image"), L"");
  EXPECT_EQ(GetExtension(L"image.mrc"), L"mrc");
  EXPECT_EQ(GetExtension(L"Image.MRC"), L"MRC");
  EXPECT_EQ(GetExtension(L"archive.tar.ser"), L"ser");
  EXPECT_EQ(GetExtension(L"image."), L"");
  EXPECT_EQ(GetExtension(L"image.mrc."), L"");
  EXPECT_EQ(GetExtension(L"."), L"");
  EXPECT_EQ(GetExtension(L".raw"), L"raw");
}

TEST(GetExtension, SearchesTheWholePath) {
  EXPECT_EQ(GetExtension(L"C:\\scans.old\\image"), L"old\\image");
  EXPECT_EQ(GetExtension(L"C:\\scans.mrc\\image"), L"mrc\\image");
  EXPECT_EQ(GetExtension(L"C:\\scans.old\\image.raw"), L"raw");
}

TEST(Extensions, AreComparedAsAWholeIgnoringCase) {
  struct Row {
    std::function<bool(const std::wstring&)> test;
    std::wstring extension;
  };
  const Row rows[] = {
      {IsSerExtension, L"ser"}, {IsMrcExtension, L"ali"}, {IsMrcExtension, L"rec"}, {IsMrcExtension, L"mrc"},
      {IsEbnExtension, L"ebn"}, {IsEmiExtension, L"emi"}, {IsRawExtension, L"raw"},
  };
  for (const Row& row : rows) {
    const wchar_t first = row.extension[0];
    const auto upper = static_cast<wchar_t>(first - L'a' + L'A');
    EXPECT_TRUE(row.test(row.extension));
    EXPECT_TRUE(row.test(upper + row.extension.substr(1)));
    EXPECT_FALSE(row.test(L""));
    EXPECT_FALSE(row.test(row.extension.substr(0, 2)));
    EXPECT_FALSE(row.test(row.extension + L"2"));
    EXPECT_FALSE(row.test(L"." + row.extension));
    EXPECT_FALSE(row.test(row.extension + L" "));
    EXPECT_FALSE(row.test(row.extension + std::wstring(1, L'\0')));
    // Only the case is ignored: a first letter that differs in another bit is another letter.
    EXPECT_FALSE(row.test(static_cast<wchar_t>(first ^ 0x80) + row.extension.substr(1)));
    // Each test accepts its own extensions only.
    for (const Row& other : rows) {
      const bool same = row.extension == other.extension ||
                        (IsMrcExtension(row.extension) && IsMrcExtension(other.extension));
      EXPECT_EQ(row.test(other.extension), same);
    }
  }
}

// New file kinds are registered after these.
TEST(FileKinds, KeepTheirOrderOfRegistration) {
  const std::array<std::wstring_view, 7> first = {L"mrc", L"ali", L"rec", L"ser", L"ebn", L"emi", L"raw"};
  ASSERT_GE(kExtensions.size(), first.size());
  EXPECT_TRUE(std::equal(first.begin(), first.end(), kExtensions.begin()));
}

TEST(FileKinds, HaveDistinctExtensionsAndAReaderEach) {
  for (const std::wstring_view extension : kExtensions) {
    EXPECT_EQ(std::ranges::count(kExtensions, extension), 1) << std::wstring(extension);
    std::istringstream stream;
    EXPECT_NE(CreateFileTypeInfo(stream, std::wstring(extension)), nullptr) << std::wstring(extension);
  }
}

TEST(CreateFileTypeInfo, ChoosesTheReaderByExtension) {
  EXPECT_TRUE(Makes<SerFileInfo>(L"a.ser"));
  EXPECT_TRUE(Makes<MrcFileInfo>(L"a.ali"));
  EXPECT_TRUE(Makes<MrcFileInfo>(L"a.rec"));
  EXPECT_TRUE(Makes<MrcFileInfo>(L"a.mrc"));
  EXPECT_TRUE(Makes<EbnFileInfo>(L"a.ebn"));
  EXPECT_TRUE(Makes<EmiFileInfo>(L"a.emi"));
  EXPECT_TRUE(Makes<RawFileInfo>(L"a.raw"));

  EXPECT_TRUE(Makes<MrcFileInfo>(L"Image.MRC"));
  EXPECT_TRUE(Makes<MrcFileInfo>(L"stack.Ali"));
  EXPECT_TRUE(Makes<SerFileInfo>(L"archive.tar.ser"));
}

TEST(CreateFileTypeInfo, MakesNoneForOtherExtensions) {
  EXPECT_TRUE(MakesNone(L"x.mrc2"));
  EXPECT_TRUE(MakesNone(L"x.mr"));
  EXPECT_TRUE(MakesNone(L"x.mrc."));
  EXPECT_TRUE(MakesNone(L"x"));
  EXPECT_TRUE(MakesNone(L""));
  EXPECT_TRUE(MakesNone(L"C:\\scans.old\\image"));
  EXPECT_TRUE(MakesNone(L"C:\\scans.mrc\\image"));
}

TEST(CreateFileTypeInfo, HasParsedTheHeader) {
  const auto valid = [](const std::string& bytes, const std::wstring& extension) {
    std::istringstream stream(bytes);
    return CreateFileTypeInfo(stream, extension)->IsValid();
  };
  Testing::SerFile ser;
  ser.elements.resize(1);
  EXPECT_TRUE(valid(ser.Bytes(), L"SER"));
  EXPECT_TRUE(valid(Testing::MrcFile().Bytes(), L"rec"));
  EXPECT_TRUE(valid(Testing::EbnFile().Bytes(), L"ebn"));
  EXPECT_TRUE(valid(Testing::OneImageEmiFile(0x2202, 1, 1, "x").Bytes(), L"emi"));
  EXPECT_TRUE(valid(Testing::RawFile().Bytes(), L"raw"));
}

TEST(CreateFileTypeInfo, IgnoresTheContents) {
  const std::string bytes = Testing::RawFile().Bytes();
  EXPECT_TRUE(Makes<EbnFileInfo>(L"a.ebn", bytes));
  std::istringstream stream(bytes);
  EXPECT_FALSE(CreateFileTypeInfo(stream, L"ebn")->IsValid());
}

TEST(CreateFileTypeInfo, LetsTheExceptionsOfReadersThrough) {
  std::istringstream emi(Testing::EmiFile{.items = Testing::EmiText(0, "text")}.Bytes());
  EXPECT_THROW(CreateFileTypeInfo(emi, L"emi"), std::invalid_argument);
  Testing::SerFile file;
  file.elements.resize(1);
  file.dimensions[0].unitsLength = -1;
  std::istringstream ser(file.Bytes());
  EXPECT_THROW(CreateFileTypeInfo(ser, L"ser"), std::length_error);
}

TEST(CreateFileTypeInfo, DeletingAReaderDoesNotChangeTheStream) {
  std::istringstream stream(Testing::EbnFile{.model = 1, .afterHeader = "x"}.Bytes());
  auto reader = CreateFileTypeInfo(stream, L"ebn");
  const auto position = stream.tellg();
  reader.reset();
  EXPECT_TRUE(stream.good());
  EXPECT_EQ(stream.tellg(), position);
  EXPECT_EQ(stream.get(), 'x');
}

TEST(CreateFileTypeInfo, ReadersOfFailedStreamsAreNotValid) {
  for (const wchar_t* extension : {L"ser", L"mrc", L"ebn", L"emi", L"raw"}) {
    std::istringstream stream(Testing::MrcFile().Bytes());
    stream.setstate(std::ios_base::failbit);
    EXPECT_FALSE(CreateFileTypeInfo(stream, extension)->IsValid());
  }
}

}  // namespace
}  // namespace Qel::Lumetra::ShellExt
