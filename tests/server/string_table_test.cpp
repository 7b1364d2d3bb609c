// Tests the string table of the built DLL.
#include <gtest/gtest.h>
#include <windows.h>

#include <map>
#include <set>
#include <string>
#include <vector>

#include "server_dll.h"

namespace Qel::Lumetra::ShellExt::Testing {
namespace {

class StringTable : public ::testing::Test {
 protected:
  StringTable() {
    EnumResourceNamesW(dll_.module(), RT_STRING, &AddBlock, reinterpret_cast<LONG_PTR>(&blocks_));
  }

  static BOOL CALLBACK AddBlock(HMODULE, const wchar_t*, wchar_t* name, LONG_PTR blocks) {
    reinterpret_cast<std::vector<wchar_t*>*>(blocks)->push_back(name);
    return TRUE;
  }

  ServerDll dll_;
  std::vector<wchar_t*> blocks_;  // resources of 16 strings each; block N begins with id 16 (N - 1)
};

TEST_F(StringTable, HoldsTheseStringsAndNoOther) {
  std::map<std::size_t, std::wstring> strings;
  for (const wchar_t* const block : blocks_) {
    ASSERT_TRUE(IS_INTRESOURCE(block));
    const HRSRC resource = FindResourceW(dll_.module(), block, RT_STRING);
    ASSERT_NE(resource, nullptr);
    const auto* text = static_cast<const wchar_t*>(LockResource(LoadResource(dll_.module(), resource)));
    std::size_t id = 16 * (reinterpret_cast<std::size_t>(block) - 1);
    for (int i = 0; i < 16; ++i, ++id) {
      const std::size_t length = *text++;
      if (length > 0) strings[id] = std::wstring(text, length);
      text += length;
    }
  }
  const std::map<std::size_t, std::wstring> expected = {
      {100, L"QelShellExt"}, {200, L"Dimensions"},    {201, L"Size"},     {202, L"Type"},
      {203, L"images"},      {204, L"Date Modified"}, {205, L"Comments"}, {206, L"Width"},
      {207, L"Height"},      {208, L"Frame Count"},   {209, L"Bit Depth"}};
  EXPECT_EQ(strings, expected);
}

TEST_F(StringTable, IsInUsEnglishOnly) {
  const auto addLanguage = [](HMODULE, const wchar_t*, const wchar_t*, WORD language,
                              LONG_PTR languages) -> BOOL {
    reinterpret_cast<std::set<WORD>*>(languages)->insert(language);
    return TRUE;
  };
  std::set<WORD> languages;
  for (const wchar_t* const block : blocks_) {
    EnumResourceLanguagesW(dll_.module(), RT_STRING, block, addLanguage,
                           reinterpret_cast<LONG_PTR>(&languages));
  }
  EXPECT_EQ(languages, std::set<WORD>{1033});
}

}  // namespace
}  // namespace Qel::Lumetra::ShellExt::Testing
