#include "path_stream.h"

#include <gtest/gtest.h>

#include <filesystem>
#include <iterator>
#include <string>

#include "temp_folder.h"

namespace Qel::Lumetra::ShellExt {
namespace {

using Testing::TempFolder;

std::string ReadAll(std::istream& stream) {
  return {std::istreambuf_iterator<char>(stream), std::istreambuf_iterator<char>()};
}

void Append(const std::filesystem::path& path, const std::string& bytes) {
  std::ofstream file(path, std::ios::binary | std::ios::app);
  ASSERT_TRUE(file.is_open());
  file << bytes;
}

TEST(PathStream, ReadsEveryByteUnchanged) {
  std::string bytes;
  for (int i = 0; i < 3 * 256; ++i) bytes += static_cast<char>(i);
  bytes += "\r\n\n\x1A\r";  // a stream in text mode changes these or ends at them
  const TempFolder folder;
  std::ifstream stream;
  OpenPath(stream, folder.Write("file", bytes).wstring().c_str());
  EXPECT_TRUE(stream.good());
  EXPECT_EQ(ReadAll(stream), bytes);
}

TEST(PathStream, OpensPathsWithAnyCharacters) {
  const TempFolder folder;
  folder.Write(u8"\u00E5ngstr\u00F6m/\u96FB\u5B50 \u03B1 \U0001F52C.mrc", "x");
  const std::wstring name = L"/\u00E5ngstr\u00F6m/\u96FB\u5B50 \u03B1 \U0001F52C.mrc";
  std::ifstream stream;
  OpenPath(stream, (folder.path().wstring() + name).c_str());
  EXPECT_EQ(ReadAll(stream), "x");
}

TEST(PathStream, ClearsTheStateOnSuccess) {
  const TempFolder folder;
  std::ifstream stream;
  OpenPath(stream, (folder.path() / "absent").wstring().c_str());
  EXPECT_TRUE(stream.fail());
  OpenPath(stream, folder.Write("file", "x").wstring().c_str());
  EXPECT_TRUE(stream.good());
}

TEST(PathStream, FailsWhenThereIsNoFile) {
  const TempFolder folder;
  for (const std::filesystem::path& path : {folder.path() / "absent", folder.path() / "absent" / "file",
                                            folder.path(), std::filesystem::path()}) {
    std::ifstream stream;
    OpenPath(stream, path.wstring().c_str());
    EXPECT_TRUE(stream.fail()) << path;
    EXPECT_FALSE(stream.bad()) << path;
    EXPECT_FALSE(stream.is_open()) << path;
  }
}

TEST(PathStream, FailsForAStreamThatIsAlreadyOpen) {
  const TempFolder folder;
  const std::wstring first = folder.Write("first", "1").wstring();
  const std::wstring second = folder.Write("second", "2").wstring();
  std::ifstream stream;
  OpenPath(stream, first.c_str());
  OpenPath(stream, second.c_str());
  EXPECT_TRUE(stream.fail());
  // The stream still reads the first file.
  stream.clear();
  EXPECT_EQ(ReadAll(stream), "1");
  // Once closed, it can be opened again.
  stream.close();
  OpenPath(stream, second.c_str());
  EXPECT_TRUE(stream.good());
  EXPECT_EQ(ReadAll(stream), "2");
}

TEST(PathStream, OtherProgramsMayWriteWhileItIsOpen) {
  const TempFolder folder;
  const auto path = folder.Write("file", "one");
  std::ifstream stream;
  OpenPath(stream, path.wstring().c_str());
  Append(path, " two");
  EXPECT_EQ(ReadAll(stream), "one two");
}

TEST(PathStream, OpensAFileThatAnotherProgramIsWriting) {
  const TempFolder folder;
  const auto path = folder.path() / "file";
  std::ofstream writer(path, std::ios::binary);
  writer << "written" << std::flush;
  std::ifstream stream;
  OpenPath(stream, path.wstring().c_str());
  EXPECT_EQ(ReadAll(stream), "written");
}

TEST(PathStream, OtherProgramsMayRenameAndDeleteWhileItIsOpen) {
  const TempFolder folder;
  const auto path = folder.Write("file", "text");
  std::ifstream stream;
  OpenPath(stream, path.wstring().c_str());
  std::filesystem::rename(path, folder.path() / "renamed");
  EXPECT_TRUE(std::filesystem::remove(folder.path() / "renamed"));
  EXPECT_EQ(ReadAll(stream), "text");
}

TEST(PathStream, ReadsBeyond4GiB) {
  constexpr std::int64_t kPosition = (std::int64_t{5} << 30) + 1;
  const TempFolder folder;
  const auto path = folder.Write("file", "");
  Testing::Lengthen(path, kPosition);
  Append(path, "beyond");
  std::ifstream stream;
  OpenPath(stream, path.wstring().c_str());
  stream.seekg(kPosition + 2);
  EXPECT_EQ(stream.tellg(), std::streampos(kPosition + 2));
  EXPECT_EQ(ReadAll(stream), "yond");
}

}  // namespace
}  // namespace Qel::Lumetra::ShellExt
