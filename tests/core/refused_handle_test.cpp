// Tests the opening of a file whose handle the C runtime refuses.
#include <gtest/gtest.h>
#include <windows.h>

#include <cstdint>

#include "import_patch.h"
#include "path_stream.h"
#include "temp_folder.h"

namespace Qel::Lumetra::ShellExt {
namespace {

int __cdecl RefuseHandle(std::intptr_t, int) {
  return -1;
}

TEST(PathStream, ClosesAHandleThatTheRuntimeRefuses) {
  const Testing::TempFolder folder;
  const std::wstring path = folder.Write("file", "x").wstring();
  std::ifstream stream;
  {
    const Testing::ImportPatch patch(GetModuleHandleW(nullptr), "_open_osfhandle", RefuseHandle);
    OpenPath(stream, path.c_str());
  }
  EXPECT_TRUE(stream.fail());
  EXPECT_FALSE(stream.is_open());
  // An exclusive open fails while any other handle of the file is open.
  const HANDLE file =
      CreateFileW(path.c_str(), GENERIC_READ, 0, nullptr, OPEN_EXISTING, FILE_ATTRIBUTE_NORMAL, nullptr);
  EXPECT_NE(file, INVALID_HANDLE_VALUE);
  CloseHandle(file);
}

}  // namespace
}  // namespace Qel::Lumetra::ShellExt
