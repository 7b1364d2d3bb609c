#include "mrc_file_info.h"

#include <gtest/gtest.h>

#include <sstream>

#include "bitmap_pixels.h"

namespace Qel::Lumetra::ShellExt {
namespace {

TEST(Mrc, Smoke) {
  std::string bytes(1024, '\0');
  bytes[0] = 4;
  bytes[4] = 2;
  bytes[8] = 1;
  for (char c = 0; c < 8; ++c) bytes += c;
  std::istringstream stream(bytes);
  MrcFileInfo info(stream, L"mrc");
  ASSERT_TRUE(info.IsValid());
  const auto pixels = Testing::TakeBitmap(info.CreateThumbnail({10, 10}));
  EXPECT_EQ(pixels.bytes.size(), 8u);
  EXPECT_EQ(pixels.bytes[0], 145);
  EXPECT_EQ(pixels.colours.size(), 256u);
}

}  // namespace
}  // namespace Qel::Lumetra::ShellExt
