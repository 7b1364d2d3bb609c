// Tests how the built DLL registers itself, in a private registry.
#include <gtest/gtest.h>
#include <windows.h>

#include <shlobj.h>

#include <filesystem>
#include <functional>
#include <string>
#include <string_view>
#include <vector>

#include "child_process.h"
#include "dll_registration.h"
#include "expected_registration.h"
#include "import_patch.h"
#include "process_census.h"
#include "registry_reader.h"
#include "registry_writes.h"
#include "same_contents.h"
#include "scarce_system.h"
#include "temp_folder.h"

namespace Qel::Lumetra::ShellExt::Testing {
namespace {

constexpr LCID kOtherLocale = MAKELCID(MAKELANGID(LANG_GERMAN, SUBLANG_GERMAN), SORT_DEFAULT);

/// A notification that the DLL sent to the shell.
struct Notification {
  LONG event;
  UINT flags;
  const void* first;
  const void* second;
};
std::vector<Notification> g_notifications;

void WINAPI RecordNotification(LONG event, UINT flags, const void* first, const void* second) {
  g_notifications.push_back({event, flags, first, second});
}

/// The locales that the DLL has set for its thread.
std::vector<LCID> g_locales;

BOOL WINAPI RecordLocale(LCID locale) {
  g_locales.push_back(locale);
  return SetThreadLocale(locale);
}

/// How often the DLL has looked for a script.
int g_scriptSearches = 0;

HRSRC WINAPI CountScriptSearch(HMODULE module, const wchar_t* name, const wchar_t* type) {
  ++g_scriptSearches;
  return FindResourceW(module, name, type);
}

class Registration : public ::testing::Test {
 protected:
  Registration() {
    g_notifications.clear();
    g_locales.clear();
    g_scriptSearches = 0;
    SetThreadLocale(kOtherLocale);
  }

  ~Registration() override {
    EXPECT_EQ(GetThreadLocale(), kOtherLocale);
    if (!g_locales.empty()) {
      EXPECT_EQ(g_locales, (std::vector<LCID>{LOCALE_SYSTEM_DEFAULT, kOtherLocale}));
    }
  }

  /// Calls an entry point and records its changes, script searches, locales and notifications.
  HRESULT Observe(HRESULT (DllRegistration::*entryPoint)() const, RegistryWrites::Decide decide) {
    const ImportPatch notify(server_.module(), "SHChangeNotify", &RecordNotification);
    const ImportPatch locale(server_.module(), "SetThreadLocale", &RecordLocale);
    const ImportPatch find(server_.module(), "FindResourceW", &CountScriptSearch);
    const RegistryWrites writes(server_.module(), std::move(decide));
    g_locales.clear();
    const HRESULT result = (server_.*entryPoint)();
    writes_ = writes.count();
    return result;
  }

  static LSTATUS Allow(std::size_t) { return ERROR_SUCCESS; }

  static RegistryWrites::Decide FailAt(std::size_t change) {
    return [change](std::size_t number) { return number == change ? ERROR_ACCESS_DENIED : ERROR_SUCCESS; };
  }

  PrivateRegistry registry_;
  DllRegistration server_;
  std::size_t writes_ = 0;
};

TEST_F(Registration, WritesExactlyTheExpectedContents) {
  ASSERT_EQ(server_.Register(), S_OK);
  EXPECT_TRUE(Same(registry_.Contents(), ExpectedAfterRegistering(ServerDll::Path())));
}

TEST_F(Registration, RegisteringTwiceIsTheSameAsOnce) {
  ASSERT_EQ(server_.Register(), S_OK);
  ASSERT_EQ(server_.Register(), S_OK);
  EXPECT_TRUE(Same(registry_.Contents(), ExpectedAfterRegistering(ServerDll::Path())));
}

/// Makes a key with a default value and another value.
void MakeKey(HKEY root, const std::wstring& path) {
  const wchar_t text[] = L"foreign";
  for (const wchar_t* value : {L"", L"Foreign"}) {
    ASSERT_EQ(RegSetKeyValueW(root, path.c_str(), value, REG_SZ, text, sizeof(text)), ERROR_SUCCESS);
  }
}

TEST_F(Registration, RegisteringRemovesStaleSubkeysOfItsClassesAndHandlers) {
  for (const wchar_t* key :
       {L"CLSID\\{79E696A1-2FA5-4B3E-9610-D5F760417E62}\\Stale\\Deeper",
        L"CLSID\\{79E696A1-2FA5-4B3E-9610-D5F760417E62}\\InprocServer32\\Stale",
        L"CLSID\\{ADF28042-3A9F-4409-9C62-444B018A7810}\\Stale",
        L"Wow6432Node\\CLSID\\{ADF28042-3A9F-4409-9C62-444B018A7810}\\InProcServer32\\Stale",
        L".raw\\ShellEx\\PropertyHandler\\Stale"}) {
    MakeKey(HKEY_CLASSES_ROOT, key);
  }
  ASSERT_EQ(server_.Register(), S_OK);
  EXPECT_EQ(registry_.Contents().size(), ExpectedAfterRegistering(ServerDll::Path()).size());
  for (const std::wstring& line : registry_.Contents()) {
    EXPECT_EQ(line.find(L"Stale"), std::wstring::npos) << line;
    EXPECT_EQ(line.find(L"foreign"), std::wstring::npos) << line;
  }
}

TEST_F(Registration, UnregisteringLeavesOnlyTheKeysThatOthersMayShare) {
  ASSERT_EQ(server_.Register(), S_OK);
  ASSERT_EQ(server_.Unregister(), S_OK);
  EXPECT_TRUE(Same(registry_.Contents(), ExpectedAfterUnregistering()));
}

TEST_F(Registration, UnregisteringWhatWasNeverRegisteredChangesNothing) {
  const RegistryContents before = registry_.Contents();
  EXPECT_EQ(server_.Unregister(), S_OK);
  EXPECT_TRUE(Same(registry_.Contents(), before));
}

TEST_F(Registration, KeepsTheEntriesOfOthers) {
  const std::wstring windows = L"Software\\Microsoft\\Windows\\CurrentVersion";
  const std::wstring wowWindows = L"Software\\Wow6432Node\\Microsoft\\Windows\\CurrentVersion";
  for (const std::wstring& each : {windows, wowWindows}) {
    MakeKey(HKEY_LOCAL_MACHINE, each);
    MakeKey(HKEY_LOCAL_MACHINE, each + L"\\Shell Extensions");
    MakeKey(HKEY_LOCAL_MACHINE, each + L"\\Shell Extensions\\Approved");
    MakeKey(HKEY_LOCAL_MACHINE, each + L"\\PropertySystem\\PropertyHandlers");
    MakeKey(HKEY_LOCAL_MACHINE, each + L"\\PropertySystem\\PropertyHandlers\\.tif");
  }
  for (const wchar_t* key :
       {L".mrc", L".mrc\\ShellEx", L".mrc\\ShellEx\\Foreign", L".ebn\\OpenWithList", L".tif", L"CLSID",
        L"CLSID\\{00000000-0000-0000-0000-00000000F0F0}", L"Wow6432Node\\CLSID", L"AppID",
        L"AppID\\{00000000-0000-0000-0000-00000000F0F0}", L"QEL.Other"}) {
    MakeKey(HKEY_CLASSES_ROOT, key);
  }
  const RegistryContents before = registry_.Contents();

  ASSERT_EQ(server_.Register(), S_OK);
  EXPECT_TRUE(Without(before, registry_.Contents()).empty());
  ASSERT_EQ(server_.Unregister(), S_OK);
  RegistryContents expected = before;
  expected.merge(ExpectedAfterUnregistering());
  EXPECT_TRUE(Same(registry_.Contents(), expected));
}

TEST_F(Registration, KeepsAnUnmarkedKeyThatOthersUse) {
  MakeKey(HKEY_LOCAL_MACHINE,
          L"Software\\Microsoft\\Windows\\CurrentVersion\\PropertySystem\\PropertyHandlers\\.ebn");
  MakeKey(HKEY_CLASSES_ROOT, L"AppID\\Brisel.DLL");
  const RegistryContents before = registry_.Contents();
  ASSERT_EQ(server_.Register(), S_OK);
  ASSERT_EQ(server_.Unregister(), S_OK);
  const RegistryContents lost = Without(before, registry_.Contents());
  // Registration has replaced this value.
  EXPECT_EQ(lost, (RegistryContents{L"HKLM\\Software\\Microsoft\\Windows\\CurrentVersion\\PropertySystem\\"
                                    L"PropertyHandlers\\.ebn : @ = s 'foreign'"}));
}

TEST_F(Registration, NotifiesTheShellOnceAndOnSuccessOnly) {
  for (const auto entryPoint : {&DllRegistration::Register, &DllRegistration::Unregister}) {
    g_notifications.clear();
    ASSERT_EQ(Observe(entryPoint, Allow), S_OK);
    ASSERT_EQ(g_notifications.size(), 1u);
    EXPECT_EQ(g_notifications[0].event, SHCNE_ASSOCCHANGED);
    EXPECT_EQ(g_notifications[0].flags, static_cast<UINT>(SHCNF_IDLIST));
    EXPECT_EQ(g_notifications[0].first, nullptr);
    EXPECT_EQ(g_notifications[0].second, nullptr);

    g_notifications.clear();
    ASSERT_EQ(Observe(&DllRegistration::Register, Allow), S_OK);
    g_notifications.clear();
    EXPECT_EQ(Observe(entryPoint, FailAt(20)), E_ACCESSDENIED);
    EXPECT_TRUE(g_notifications.empty());
  }
}

TEST_F(Registration, RunsInTheSystemLocaleAndRestoresTheThreadLocale) {
  std::vector<LCID> seen;
  const auto look = [&](std::size_t) -> LSTATUS {
    seen.push_back(GetThreadLocale());
    return ERROR_SUCCESS;
  };
  ASSERT_EQ(Observe(&DllRegistration::Register, look), S_OK);
  ASSERT_EQ(Observe(&DllRegistration::Unregister, look), S_OK);
  ASSERT_FALSE(seen.empty());
  for (const LCID locale : seen) EXPECT_EQ(locale, GetSystemDefaultLCID());
  // The destructor of the fixture checks that the locale is restored, here and after every failure.
}

TEST_F(Registration, LeavesNothingInTheProcess) {
  const auto takeAfter = [this](int rounds) {
    for (int i = 0; i < rounds; ++i) {
      EXPECT_EQ(Observe(&DllRegistration::Register, Allow), S_OK);
      EXPECT_EQ(Observe(&DllRegistration::Unregister, FailAt(5)), E_ACCESSDENIED);
      EXPECT_EQ(Observe(&DllRegistration::Unregister, Allow), S_OK);
      g_notifications.clear();
    }
    return ProcessCensus::Take();
  };
  // The system makes a permanent allocation now and then. A leak would grow in every one of these rounds.
  bool isConstant = false;
  ProcessCensus before = takeAfter(2);
  for (int i = 0; i < 5 && !isConstant; ++i) {
    const ProcessCensus after = takeAfter(3);
    isConstant = after.handles <= before.handles && after.heapBlocks <= before.heapBlocks;
    before = after;
  }
  EXPECT_TRUE(isConstant);
}

TEST_F(Registration, ReportsALackOfMemoryAtAnyPointAndWorksOnceThereIsSome) {
  const ScarceSystem system(server_.module());
  const auto getsPast = [&](int place, ScarceSystem::Then then) {
    ScarceSystem::FailAt(place, then);
    const HRESULT result = server_.Register();
    const bool failed = ScarceSystem::Recover() != ScarceSystem::Lack::kNothing;
    EXPECT_EQ(result, failed ? E_OUTOFMEMORY : S_OK) << "place " << place;
    return !failed;
  };
  int places = 0;
  while (!getsPast(places, ScarceSystem::Then::kRecovers) && !HasFailure()) ++places;
  EXPECT_GT(places, 100);
  // If memory stays exhausted, only the cleanup differs, so a sample of the places is enough.
  for (int place = 0; place < places; place += 10) getsPast(place, ScarceSystem::Then::kKeepsFailing);
  ASSERT_EQ(server_.Register(), S_OK);
  EXPECT_TRUE(Same(registry_.Contents(), ExpectedAfterRegistering(ServerDll::Path())));
}

// interrupted_registration_test abandons a call at every change, as if the process had died. This test lets a
// process die at a few changes and checks that this has the same effect.
TEST_F(Registration, IsRepairedOrCleanedUpAfterAProcessDied) {
  const std::filesystem::path program =
      ServerDll::Path().parent_path() / L"tests" / L"dying_registration.exe";
  const RegistryContents complete = ExpectedAfterRegistering(ServerDll::Path());
  const RegistryContents leftOver = ExpectedAfterUnregistering();
  const auto dieAt = [&](const wchar_t* direction, std::size_t change) {
    return RunProcess(program, {direction, registry_.path(), std::to_wstring(change)});
  };
  ASSERT_EQ(Observe(&DllRegistration::Register, Allow), S_OK);
  const std::size_t changes = writes_;
  for (std::size_t i = 0; i < changes; i += changes / 8) {
    ASSERT_EQ(server_.Unregister(), S_OK);
    ASSERT_EQ(dieAt(L"register", i), 3u);
    ASSERT_EQ(server_.Register(), S_OK);
    ASSERT_TRUE(Same(registry_.Contents(), complete)) << "change " << i;

    ASSERT_EQ(dieAt(L"unregister", i / 8), 3u);
    ASSERT_EQ(server_.Unregister(), S_OK);
    ASSERT_EQ(Without(registry_.Contents(), leftOver), RegistryContents{}) << "change " << i;

    ASSERT_EQ(dieAt(L"register", i), 3u);
    ASSERT_EQ(server_.Unregister(), S_OK);
    ASSERT_EQ(Without(registry_.Contents(), leftOver), RegistryContents{}) << "change " << i;
  }
  EXPECT_EQ(dieAt(L"register", changes), 0u);
  EXPECT_TRUE(Same(registry_.Contents(), complete));
}

TEST_F(Registration, WritesThePathOfTheDllUnchanged) {
  const TempFolder folder;
  for (const wchar_t* name :
       {L"with spaces", L"it's quoted", L"''", L"100% {braces} %MODULE%", L"\u00c4\u03a9\u0416\u4e2d"}) {
    const std::filesystem::path dll = folder.path() / name / L"QelShellExt.dll";
    std::filesystem::create_directory(dll.parent_path());
    std::filesystem::copy_file(ServerDll::Path(), dll);
    registry_.Clear();
    const DllRegistration server(dll);
    ASSERT_EQ(server.Register(), S_OK);
    EXPECT_TRUE(Same(registry_.Contents(), ExpectedAfterRegistering(dll)));
    ASSERT_EQ(server.Unregister(), S_OK);
    EXPECT_TRUE(Same(registry_.Contents(), ExpectedAfterUnregistering()));
  }
}

/// Returns a module path of `kLength` characters.
template <DWORD kLength>
DWORD WINAPI LongModulePath(HMODULE, wchar_t* buffer, DWORD size) {
  const std::wstring path = L"C:\\" + std::wstring(kLength - 3, L'x');
  const DWORD count = std::min(kLength, size);
  path.copy(buffer, count);
  if (kLength < size) {
    buffer[kLength] = L'\0';
    return kLength;
  }
  buffer[size - 1] = L'\0';
  SetLastError(ERROR_INSUFFICIENT_BUFFER);
  return size;
}

TEST_F(Registration, RefusesAPathOf260CharactersBeforeItLooksForAScript) {
  for (const auto path : {&LongModulePath<260>, &LongModulePath<261>, &LongModulePath<1000>}) {
    const ImportPatch patch(server_.module(), "GetModuleFileNameW", path);
    for (const auto entryPoint : {&DllRegistration::Register, &DllRegistration::Unregister}) {
      EXPECT_EQ(Observe(entryPoint, Allow), static_cast<HRESULT>(0x8007007A));
      EXPECT_EQ(writes_, 0u);
    }
  }
  EXPECT_EQ(g_scriptSearches, 0);
  EXPECT_TRUE(g_notifications.empty());
}

TEST_F(Registration, RefusesADllWithATooLongPath) {
  const TempFolder folder;
  std::filesystem::path deep = L"\\\\?\\" + folder.path().wstring();
  while (deep.wstring().size() < 280) deep /= std::wstring(50, L'x');
  ASSERT_TRUE(std::filesystem::create_directories(deep));
  const std::filesystem::path dll = deep / L"QelShellExt.dll";
  ASSERT_TRUE(CopyFileW(ServerDll::Path().c_str(), dll.c_str(), TRUE));
  {
    const DllRegistration server(dll);
    EXPECT_EQ(server.Register(), static_cast<HRESULT>(0x8007007A));
    EXPECT_EQ(server.Unregister(), static_cast<HRESULT>(0x8007007A));
  }
  EXPECT_EQ(registry_.Contents().size(), 3u);
  // std::filesystem does not delete paths with the prefix \\?\ here.
  DeleteFileW(dll.c_str());
  for (; deep.filename() != folder.path().filename(); deep = deep.parent_path())
    RemoveDirectoryW(deep.c_str());
}

TEST_F(Registration, AcceptsAPathOf259Characters) {
  const ImportPatch patch(server_.module(), "GetModuleFileNameW", &LongModulePath<259>);
  ASSERT_EQ(server_.Register(), S_OK);
  EXPECT_TRUE(Same(registry_.Contents(), ExpectedAfterRegistering(L"C:\\" + std::wstring(256, L'x'))));
}

DWORD WINAPI NoModulePath(HMODULE, wchar_t*, DWORD) {
  SetLastError(ERROR_INVALID_HANDLE);
  return 0;
}

TEST_F(Registration, ReturnsAFailureToFindItsOwnPath) {
  const ImportPatch patch(server_.module(), "GetModuleFileNameW", &NoModulePath);
  for (const auto entryPoint : {&DllRegistration::Register, &DllRegistration::Unregister}) {
    EXPECT_EQ(Observe(entryPoint, Allow), HRESULT_FROM_WIN32(ERROR_INVALID_HANDLE));
    EXPECT_EQ(writes_, 0u);
  }
}

/// Finds every script except 107.
HRSRC WINAPI LackScript(HMODULE module, const wchar_t* name, const wchar_t* type) {
  return FindResourceW(module, name == MAKEINTRESOURCEW(107) ? MAKEINTRESOURCEW(999) : name, type);
}

TEST_F(Registration, StopsAtAMissingScript) {
  ASSERT_EQ(server_.Register(), S_OK);
  const RegistryContents complete = registry_.Contents();
  ASSERT_EQ(server_.Unregister(), S_OK);

  {
    const ImportPatch patch(server_.module(), "FindResourceW", &LackScript);
    EXPECT_EQ(server_.Register(), HRESULT_FROM_WIN32(ERROR_RESOURCE_NAME_NOT_FOUND));
  }
  // The entries of the earlier scripts remain. The later scripts are not run.
  RegistryContents contents = registry_.Contents();
  const std::wstring classes = L"HKLM\\Software\\Classes\\";
  EXPECT_TRUE(contents.contains(classes + L"AppID\\Brisel.DLL"));
  EXPECT_TRUE(contents.contains(classes + L"CLSID\\{79E696A1-2FA5-4b3e-9610-D5F760417E62}"));
  EXPECT_TRUE(contents.contains(classes + L"CLSID\\{E37DEDA9-F652-401B-B619-A1A88EADD003}"));
  EXPECT_FALSE(contents.contains(classes + L"CLSID\\{E217E970-5E2E-11E1-B86C-0800200C9A66}"));
  EXPECT_FALSE(contents.contains(classes + L"CLSID\\{ADF28042-3A9F-4409-9C62-444B018A7810}"));

  ASSERT_EQ(server_.Register(), S_OK);
  {
    const ImportPatch patch(server_.module(), "FindResourceW", &LackScript);
    EXPECT_EQ(server_.Unregister(), HRESULT_FROM_WIN32(ERROR_RESOURCE_NAME_NOT_FOUND));
  }
  contents = registry_.Contents();
  EXPECT_FALSE(contents.contains(classes + L"CLSID\\{79E696A1-2FA5-4b3e-9610-D5F760417E62}"));
  EXPECT_FALSE(contents.contains(classes + L"CLSID\\{E37DEDA9-F652-401B-B619-A1A88EADD003}"));
  EXPECT_TRUE(contents.contains(classes + L"CLSID\\{E217E970-5E2E-11E1-B86C-0800200C9A66}"));
  EXPECT_TRUE(contents.contains(classes + L"CLSID\\{ADF28042-3A9F-4409-9C62-444B018A7810}"));
  // The module's own script runs last.
  EXPECT_TRUE(contents.contains(classes + L"AppID\\Brisel.DLL"));
}

/// Returns text that is not a valid script, long enough for the size of every script.
void* WINAPI BrokenScript(HGLOBAL) {
  static std::string text(1 << 16, '{');
  return text.data();
}

TEST_F(Registration, RefusesAScriptThatCannotBeParsed) {
  const ImportPatch patch(server_.module(), "LockResource", &BrokenScript);
  for (const auto entryPoint : {&DllRegistration::Register, &DllRegistration::Unregister}) {
    EXPECT_EQ(Observe(entryPoint, Allow), HRESULT_FROM_WIN32(ERROR_INVALID_DATA));
    EXPECT_EQ(writes_, 0u);
  }
  EXPECT_TRUE(g_notifications.empty());
}

/// The script that every run finds instead of its own.
std::string g_script;

void* WINAPI ThatScript(HGLOBAL) {
  return g_script.data();
}
DWORD WINAPI SizeOfThatScript(HMODULE, HRSRC) {
  return static_cast<DWORD>(g_script.size());
}
DWORD WINAPI QuotedModulePath(HMODULE, wchar_t* buffer, DWORD) {
  return static_cast<DWORD>(std::wstring(L"C:\\it''s.dll").copy(buffer, 12));
}

TEST_F(Registration, ReplacesModuleByThePathWithDoubledQuotesAndModuleRawByThePathItself) {
  g_script = "HKCR { A { val Module = s '%Module%' val Raw = s '%MODULE_RAW%' val AppId = s '%appid%' } }";
  const ImportPatch script(server_.module(), "LockResource", &ThatScript);
  const ImportPatch size(server_.module(), "SizeofResource", &SizeOfThatScript);
  const ImportPatch path(server_.module(), "GetModuleFileNameW", &QuotedModulePath);
  ASSERT_EQ(server_.Register(), S_OK);
  const RegistryContents contents = registry_.Contents();
  const std::wstring key = L"HKLM\\Software\\Classes\\A : ";
  EXPECT_TRUE(contents.contains(key + L"Module = s 'C:\\it''s.dll'"));
  EXPECT_TRUE(contents.contains(key + L"Raw = s 'C:\\it's.dll'"));
  EXPECT_TRUE(contents.contains(key + L"AppId = s '{66A6E9D4-0F73-4d4a-A7EE-F53AE6C5F868}'"));
}

/// Whether the DLL has created a volatile key or written a string without a terminator.
bool g_createdVolatile = false;
bool g_textWithoutNull = false;

LSTATUS WINAPI CheckOptions(HKEY key, LPCWSTR name, DWORD reserved, LPWSTR type, DWORD options, REGSAM access,
                            SECURITY_ATTRIBUTES* security, PHKEY opened, LPDWORD disposition) {
  if (options != REG_OPTION_NON_VOLATILE) g_createdVolatile = true;
  return RegCreateKeyExW(key, name, reserved, type, options, access, security, opened, disposition);
}
LSTATUS WINAPI CheckData(HKEY key, LPCWSTR name, DWORD reserved, DWORD type, const BYTE* data, DWORD size) {
  if (type == REG_SZ) {
    const std::wstring_view text(reinterpret_cast<const wchar_t*>(data), size / sizeof(wchar_t));
    if (text.find(L'\0') != text.size() - 1) g_textWithoutNull = true;
  }
  return RegSetValueExW(key, name, reserved, type, data, size);
}

TEST_F(Registration, CreatesPermanentKeysAndTerminatedStrings) {
  g_createdVolatile = g_textWithoutNull = false;
  const ImportPatch keys(server_.module(), "RegCreateKeyExW", &CheckOptions);
  const ImportPatch values(server_.module(), "RegSetValueExW", &CheckData);
  ASSERT_EQ(server_.Register(), S_OK);
  EXPECT_FALSE(g_createdVolatile);
  EXPECT_FALSE(g_textWithoutNull);
}

TEST_F(Registration, ReturnsAFailureToQueryAKey) {
  ASSERT_EQ(server_.Register(), S_OK);
  const ImportPatch query(
      server_.module(), "RegQueryInfoKeyW",
      +[](HKEY, LPWSTR, LPDWORD, LPDWORD, LPDWORD, LPDWORD, LPDWORD, LPDWORD, LPDWORD, LPDWORD, LPDWORD,
          PFILETIME) -> LSTATUS WINAPI { return ERROR_ACCESS_DENIED; });
  EXPECT_EQ(server_.Unregister(), E_ACCESSDENIED);
}

TEST_F(Registration, TreatsAPathThatIsNotFoundAsADeletedKey) {
  const ImportPatch tree(
      server_.module(), "RegDeleteTreeW",
      +[](HKEY, LPCWSTR) -> LSTATUS WINAPI { return ERROR_PATH_NOT_FOUND; });
  EXPECT_EQ(server_.Unregister(), S_OK);
}

TEST_F(Registration, ContainsNineScriptsInEnglish) {
  for (int id = 101; id <= 109; ++id) {
    EXPECT_TRUE(FindResourceExW(server_.module(), L"REGISTRY", MAKEINTRESOURCEW(id), 1033)) << id;
  }
  EXPECT_FALSE(FindResourceExW(server_.module(), L"REGISTRY", MAKEINTRESOURCEW(100), 1033));
  EXPECT_FALSE(FindResourceExW(server_.module(), L"REGISTRY", MAKEINTRESOURCEW(110), 1033));
}

}  // namespace
}  // namespace Qel::Lumetra::ShellExt::Testing
