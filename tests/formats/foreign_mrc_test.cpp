// Reads files that another program has written, and compares the results with expected.txt, which
// write_mrc_files.py computes by itself. All of them are in the current folder.
#include <gtest/gtest.h>

#include <fstream>
#include <sstream>
#include <string>
#include <vector>

#include "bitmap_pixels.h"
#include "image_file_info.h"
#include "path_stream.h"

namespace Qel::Lumetra::ShellExt {
namespace {

struct Picture {
  SIZE request;
  std::int32_t width, height;
  std::vector<std::uint8_t> levels;
};

struct Expectation {
  std::string file;
  Size2 size;
  std::int32_t sections = 0;
  std::int32_t bits = 0;
  std::string type;
  std::string comment;
  std::vector<Picture> pictures;
};

std::vector<std::uint8_t> FromHex(const std::string& hex) {
  std::vector<std::uint8_t> bytes;
  for (std::size_t i = 0; i + 1 < hex.size(); i += 2) {
    bytes.push_back(static_cast<std::uint8_t>(std::stoi(hex.substr(i, 2), nullptr, 16)));
  }
  return bytes;
}

Picture ReadPicture(std::istream& line) {
  Picture picture;
  std::string hex;
  line >> picture.request.cx >> picture.request.cy >> picture.width >> picture.height >> hex;
  picture.levels = FromHex(hex);
  return picture;
}

std::vector<Expectation> ReadExpectations() {
  std::vector<Expectation> all;
  std::ifstream file("expected.txt");
  for (std::string text; std::getline(file, text);) {
    std::istringstream line(text);
    std::string key;
    line >> key;
    if (key == "file") all.emplace_back();
    Expectation& expectation = all.back();
    if (key == "file") line >> expectation.file;
    if (key == "size") line >> expectation.size.width >> expectation.size.height;
    if (key == "sections") line >> expectation.sections;
    if (key == "bits") line >> expectation.bits;
    if (key == "type") expectation.type = text.substr(key.size() + 1);
    if (key == "label") {
      expectation.comment += (expectation.comment.empty() ? "" : "\r\n") + text.substr(key.size() + 1);
    }
    if (key == "picture") expectation.pictures.push_back(ReadPicture(line));
  }
  return all;
}

std::string Narrow(const std::wstring& wide) {
  std::string narrow;
  for (const wchar_t c : wide) narrow += static_cast<char>(c);
  return narrow;
}

TEST(ForeignMrc, IsReadAsItsWriterExpects) {
  const std::vector<Expectation> all = ReadExpectations();
  ASSERT_EQ(all.size(), 48u);
  for (const Expectation& expected : all) {
    SCOPED_TRACE(expected.file);
    std::ifstream stream;
    OpenPath(stream, std::wstring(expected.file.begin(), expected.file.end()).c_str());
    const MrcFileInfo mrc(stream, L"mrc");
    ASSERT_TRUE(mrc.IsValid());
    EXPECT_EQ(mrc.GetDimensions(), expected.size);
    EXPECT_EQ(mrc.GetFrameCount(), expected.sections);
    EXPECT_EQ(mrc.GetBitDepth(), expected.bits);
    EXPECT_EQ(Narrow(mrc.GetDataTypeName()), expected.type);
    EXPECT_EQ(Narrow(mrc.GetComment()), expected.comment);
    EXPECT_EQ(expected.pictures.size(), 3u);
    for (const Picture& picture : expected.pictures) {
      const auto bitmap = Testing::TakeBitmap(mrc.CreateThumbnail(picture.request));
      EXPECT_EQ(bitmap.width, picture.width);
      EXPECT_EQ(bitmap.height, picture.height);
      EXPECT_EQ(bitmap.bytes, picture.levels);
    }
  }
}

}  // namespace
}  // namespace Qel::Lumetra::ShellExt
