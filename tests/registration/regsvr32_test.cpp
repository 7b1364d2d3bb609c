// Tests the built DLL through regsvr32 and COM, in the machine's own registry. Under Wine this is the
// registry of the prefix. What other programs have registered must not change.
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
#include "machine_registration.h"
#include "registry_reader.h"
#include "temp_folder.h"

namespace Qel::Lumetra::ShellExt::Testing {
namespace {

constexpr std::array kClasses = {kShellExtClass, kEbnHandlerClass, kRawHandlerClass, kMrcHandlerClass};

/// Converts to lower case, because the machine keeps the case of the keys that existed before.
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
    if (const std::string reason = ReasonNotToRegister(); !reason.empty()) GTEST_SKIP() << reason;
    // An earlier test may have left the DLL registered.
    ASSERT_EQ(Run({L"/s", L"/u", ServerDll::Path()}), 0u);
  }

  static std::uint32_t Run(const std::vector<std::wstring>& arguments) {
    std::array<wchar_t, MAX_PATH> system{};
    GetSystemDirectoryW(system.data(), MAX_PATH);
    return RunProcess(std::filesystem::path(system.data()) / L"regsvr32.exe", arguments);
  }

  /// Returns the contents of the keys that the server writes to. Windows may change others at any time.
  static RegistryContents Contents() {
    std::vector<std::wstring> paths;
    for (const wchar_t* const software : {L"Software\\", L"Software\\Wow6432Node\\"}) {
      for (const wchar_t* const key : {L"PropertySystem", L"Shell Extensions"}) {
        paths.push_back(std::wstring(software) + L"Microsoft\\Windows\\CurrentVersion\\" + key);
      }
    }
    const std::wstring classes = L"Software\\Classes\\";
    for (const wchar_t* const key : {L"AppID", L"CLSID", L"Wow6432Node\\CLSID"}) {
      paths.push_back(classes + key);
    }
    for (const std::wstring& name : SubkeyNames(classes)) {
      if (name.starts_with(L'.') || name.starts_with(L"QEL")) paths.push_back(classes + name);
    }

    RegistryContents contents;
    for (const std::wstring& path : paths) {
      HKEY key = nullptr;
      if (RegOpenKeyExW(HKEY_LOCAL_MACHINE, path.c_str(), 0, KEY_READ, &key) != ERROR_SUCCESS) continue;
      AddKey(contents, L"HKLM\\" + path);
      contents.merge(ReadRegistry(key, L"HKLM\\" + path));
      RegCloseKey(key);
    }
    return Folded(contents);
  }

  static std::vector<std::wstring> SubkeyNames(const std::wstring& path) {
    std::vector<std::wstring> names;
    HKEY key = nullptr;
    EXPECT_EQ(RegOpenKeyExW(HKEY_LOCAL_MACHINE, path.c_str(), 0, KEY_READ, &key), ERROR_SUCCESS);
    std::array<wchar_t, 256> name{};
    for (DWORD i = 0; RegEnumKeyW(key, i, name.data(), static_cast<DWORD>(name.size())) == ERROR_SUCCESS;
         ++i) {
      names.emplace_back(name.data());
    }
    RegCloseKey(key);
    return names;
  }

  /// Returns the lines of `before` that are not in `after`, except for the values that registering replaces.
  static RegistryContents Lost(const RegistryContents& before, const RegistryContents& after,
                               const RegistryContents& registered) {
    const auto value = [](const std::wstring& line) { return line.substr(0, line.find(L" = ") + 1); };
    RegistryContents replaced;
    for (const std::wstring& line : registered) {
      if (line.find(L" = ") != std::wstring::npos) replaced.insert(value(line));
    }
    RegistryContents lost = Without(before, after);
    std::erase_if(lost, [&](const std::wstring& line) { return replaced.contains(value(line)); });
    return lost;
  }

  static HRESULT Create(const CLSID& clsid) {
    ComPtr<IUnknown> object;
    return CoCreateInstance(clsid, nullptr, CLSCTX_INPROC_SERVER, IID_IUnknown,
                            reinterpret_cast<void**>(object.Put()));
  }

  /// Creates objects until it fails, as COM may cache a class for some time. Returns the last result.
  static HRESULT CreateUntilRefused(const CLSID& clsid) {
    HRESULT result = Create(clsid);
    for (int i = 0; i < 100 && result == S_OK; ++i) {
      Sleep(100);
      result = Create(clsid);
    }
    return result;
  }

  /// Registers and unregisters `dll`. After each step the registry may differ only by the expected lines.
  static void RegisterAndUnregister(const std::filesystem::path& dll) {
    const RegistryContents registered = Folded(ExpectedAfterRegistering(dll));
    const RegistryContents leftOver = Folded(ExpectedAfterUnregistering());
    const SavedRegistrations others;
    const RegistryContents before = Contents();

    ASSERT_EQ(Run({L"/s", dll}), 0u);
    const RegistryContents after = Contents();
    EXPECT_EQ(Without(registered, after), RegistryContents{});
    EXPECT_EQ(Without(Without(after, before), registered), RegistryContents{});
    EXPECT_EQ(Lost(before, after, registered), RegistryContents{});
    for (const CLSID& clsid : kClasses) EXPECT_EQ(Create(clsid), S_OK);
    CoFreeUnusedLibrariesEx(0, 0);

    ASSERT_EQ(Run({L"/s", L"/u", dll}), 0u);
    const RegistryContents finally = Contents();
    EXPECT_EQ(Without(leftOver, finally), RegistryContents{});
    EXPECT_EQ(Without(Without(finally, before), leftOver), RegistryContents{});
    EXPECT_EQ(Lost(before, finally, registered), RegistryContents{});
    for (const CLSID& clsid : kClasses) EXPECT_EQ(CreateUntilRefused(clsid), REGDB_E_CLASSNOTREG);
  }
};

TEST_F(Regsvr32, RegistersAndUnregistersTheDllWhereItWasBuilt) {
  RegisterAndUnregister(ServerDll::Path());
}

TEST_F(Regsvr32, RestoresWhatOthersHadRegistered) {
  const SavedRegistrations machine;
  constexpr wchar_t kKey[] = L"Software\\Classes\\.raw";
  constexpr wchar_t kTip[] = L"prop:System.Size";
  ASSERT_EQ(RegSetKeyValueW(HKEY_LOCAL_MACHINE, kKey, L"InfoTip", REG_SZ, kTip, sizeof kTip), ERROR_SUCCESS);
  const RegistryContents before = Contents();
  RegisterAndUnregister(ServerDll::Path());
  EXPECT_EQ(Without(before, Contents()), RegistryContents{});
  RegDeleteKeyValueW(HKEY_LOCAL_MACHINE, kKey, L"InfoTip");
}

TEST_F(Regsvr32, WorksFromAPathWithSpacesQuotesAndForeignLetters) {
  const TempFolder folder;
  const std::filesystem::path dll = folder.path() / L"it's \u00c4\u03a9\u0416 \u4e2d" / L"QelShellExt.dll";
  std::filesystem::create_directory(dll.parent_path());
  std::filesystem::copy_file(ServerDll::Path(), dll);
  RegisterAndUnregister(dll);
}

}  // namespace
}  // namespace Qel::Lumetra::ShellExt::Testing
