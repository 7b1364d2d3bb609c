// The built DLL through regsvr32 and COM on the machine's own registry, which under Wine is that of the
// prefix.
#include <gtest/gtest.h>
#include <windows.h>

#include <objbase.h>

#include <algorithm>
#include <array>
#include <filesystem>
#include <string>
#include <vector>

#include "child_process.h"
#include "dll_registration.h"
#include "expected_registration.h"
#include "registry_reader.h"
#include "temp_folder.h"

namespace Qel::Lumetra::ShellExt::Testing {
namespace {

constexpr std::array kClasses = {kShellExtClass, kEbnHandlerClass, kRawHandlerClass, kMrcHandlerClass};

/// The machine has its own ideas of the case of the keys that it had before.
RegistryContents Folded(const RegistryContents& contents) {
  RegistryContents folded;
  for (std::wstring line : contents) {
    CharLowerBuffW(line.data(), static_cast<DWORD>(line.size()));
    folded.insert(std::move(line));
  }
  return folded;
}

class Regsvr32 : public ::testing::Test {
 protected:
  Regsvr32() { CoInitializeEx(nullptr, COINIT_APARTMENTTHREADED); }
  ~Regsvr32() override { CoUninitialize(); }

  void SetUp() override {
    // Where it runs on a real machine, this would change what the user's shell does.
    ASSERT_TRUE(GetProcAddress(GetModuleHandleW(L"ntdll.dll"), "wine_get_version"))
        << "this test registers the DLL on the machine, so it runs in a Wine prefix only";
    // Somebody may have looked at files with the registered DLL before.
    ASSERT_EQ(Run({L"/s", L"/u", ServerDll::Path()}), 0u);
  }

  static std::uint32_t Run(const std::vector<std::wstring>& arguments) {
    std::array<wchar_t, MAX_PATH> system{};
    GetSystemDirectoryW(system.data(), MAX_PATH);
    return RunProcess(std::filesystem::path(system.data()) / L"regsvr32.exe", arguments);
  }

  /// Of the parts of the registry where the server has something, as Windows itself writes elsewhere at any
  /// time.
  static RegistryContents Contents() {
    RegistryContents contents;
    for (const std::wstring path : {L"Software\\Classes", L"Software\\Microsoft\\Windows\\CurrentVersion",
                                    L"Software\\Wow6432Node\\Microsoft\\Windows\\CurrentVersion"}) {
      HKEY key = nullptr;
      EXPECT_EQ(RegOpenKeyExW(HKEY_LOCAL_MACHINE, path.c_str(), 0, KEY_READ, &key), ERROR_SUCCESS);
      AddKey(contents, L"HKLM\\" + path);
      contents.merge(ReadRegistry(key, L"HKLM\\" + path));
      RegCloseKey(key);
    }
    return Folded(contents);
  }

  static HRESULT Create(const CLSID& clsid) {
    ComPtr<IUnknown> object;
    return CoCreateInstance(clsid, nullptr, CLSCTX_INPROC_SERVER, IID_IUnknown,
                            reinterpret_cast<void**>(object.Put()));
  }

  /// Registers and unregisters `dll`; in between and afterwards the machine differs only as it should.
  static void RegisterAndUnregister(const std::filesystem::path& dll) {
    const RegistryContents registered = Folded(ExpectedAfterRegistering(dll));
    const RegistryContents leftOver = Folded(ExpectedAfterUnregistering());
    const RegistryContents before = Contents();

    ASSERT_EQ(Run({L"/s", dll}), 0u);
    const RegistryContents after = Contents();
    EXPECT_EQ(Without(registered, after), RegistryContents{});
    EXPECT_EQ(Without(Without(after, before), registered), RegistryContents{});
    EXPECT_EQ(Without(before, after), RegistryContents{});
    for (const CLSID& clsid : kClasses) EXPECT_EQ(Create(clsid), S_OK);
    CoFreeUnusedLibrariesEx(0, 0);

    ASSERT_EQ(Run({L"/s", L"/u", dll}), 0u);
    const RegistryContents finally = Contents();
    EXPECT_EQ(Without(leftOver, finally), RegistryContents{});
    EXPECT_EQ(Without(Without(finally, before), leftOver), RegistryContents{});
    EXPECT_EQ(Without(before, finally), RegistryContents{});
    for (const CLSID& clsid : kClasses) EXPECT_EQ(Create(clsid), REGDB_E_CLASSNOTREG);
  }
};

TEST_F(Regsvr32, RegistersAndUnregistersTheDllWhereItWasBuilt) {
  RegisterAndUnregister(ServerDll::Path());
}

TEST_F(Regsvr32, WorksFromAPathWithSpacesQuotesAndOtherLetters) {
  const TempFolder folder;
  const std::filesystem::path dll = folder.path() / L"it's \u00c4\u03a9\u0416 \u4e2d" / L"QelShellExt.dll";
  std::filesystem::create_directory(dll.parent_path());
  std::filesystem::copy_file(ServerDll::Path(), dll);
  RegisterAndUnregister(dll);
}

}  // namespace
}  // namespace Qel::Lumetra::ShellExt::Testing
