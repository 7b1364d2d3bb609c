#include "registrar.h"

#include <gtest/gtest.h>

#include <fstream>
#include <iterator>
#include <map>
#include <string>
#include <vector>

#include "expected_registration.h"
#include "memory_registry.h"
#include "same_contents.h"

namespace Qel::Lumetra::ShellExt {
namespace {

using Testing::AddKey;
using Testing::MemoryRegistry;
using Testing::RegistryContents;
using enum RegistryRoot;

class Registrar : public ::testing::Test {
 protected:
  HRESULT Register(std::string_view script) { return Run(script, ScriptDirection::kRegister); }
  HRESULT Unregister(std::string_view script) { return Run(script, ScriptDirection::kUnregister); }

  /// Makes a key in HKCR with the values `values`, where L"" is the default value.
  void MakeKey(const std::wstring& path, std::initializer_list<const wchar_t*> values = {}) {
    ASSERT_EQ(registry_.CreateKey(kClassesRoot, path), S_OK);
    for (const std::wstring name : values) {
      ASSERT_EQ(registry_.SetValue(kClassesRoot, path, name, std::wstring(L"foreign")), S_OK);
    }
  }

  /// Returns the lines of HKCR without the prefix HKCR\.
  RegistryContents Contents() const {
    RegistryContents below;
    for (const std::wstring& line : registry_.Contents()) {
      if (line.starts_with(L"HKCR\\")) below.insert(line.substr(5));
    }
    return below;
  }

  MemoryRegistry registry_;

 private:
  HRESULT Run(std::string_view script, ScriptDirection direction) {
    return RunRegistryScript(script, std::vector<Replacement>{{L"PATH", L"C:\\it''s here.dll"}}, direction,
                             registry_);
  }
};

TEST_F(Registrar, WritesKeysAndValues) {
  ASSERT_EQ(Register("HKCR { A = s 'default' { val B = s '%PATH%' val C = d '7' 'D d' } }"
                     "HKLM { E }"),
            S_OK);
  EXPECT_EQ(registry_.Contents(),
            (RegistryContents{L"HKCR", L"HKCR\\A", L"HKCR\\A : @ = s 'default'",
                              L"HKCR\\A : B = s 'C:\\it's here.dll'", L"HKCR\\A : C = d 7", L"HKCR\\A\\D d",
                              L"HKLM", L"HKLM\\E"}));
}

TEST_F(Registrar, RegisteringKeepsWhatIsInAnUnmarkedOrNoRemoveKey) {
  MakeKey(L"A\\Foreign", {L"", L"x"});
  MakeKey(L"B", {L"", L"x"});
  ASSERT_EQ(Register("HKCR { A NoRemove B = s 'ours' }"), S_OK);
  EXPECT_EQ(Contents(), (RegistryContents{L"A", L"A\\Foreign", L"A\\Foreign : @ = s 'foreign'",
                                          L"A\\Foreign : x = s 'foreign'", L"B", L"B : @ = s 'ours'",
                                          L"B : x = s 'foreign'"}));
}

TEST_F(Registrar, RegisteringReplacesAForceRemoveKey) {
  MakeKey(L"A\\Stale\\Deeper", {L"x"});
  MakeKey(L"A", {L"", L"x"});
  MakeKey(L"AB");
  ASSERT_EQ(Register("HKCR { ForceRemove a { val B = d '1' } }"), S_OK);
  EXPECT_EQ(Contents(), (RegistryContents{L"a", L"a : B = d 1", L"AB"}));
}

TEST_F(Registrar, UnregisteringDeletesAForceRemoveKeyWithItsContents) {
  MakeKey(L"A\\Foreign", {L"x"});
  MakeKey(L"B");
  ASSERT_EQ(Unregister("HKCR { ForceRemove A { C } }"), S_OK);
  EXPECT_EQ(Contents(), (RegistryContents{L"B"}));
}

TEST_F(Registrar, UnregisteringDeletesOnlyWhatTheScriptNamesInANoRemoveKey) {
  MakeKey(L"A", {L"", L"ours", L"x"});
  MakeKey(L"A\\Ours");
  MakeKey(L"A\\Foreign");
  ASSERT_EQ(Unregister("HKCR { NoRemove A = s 'default' { val Ours = s 'text' Ours } }"), S_OK);
  EXPECT_EQ(Contents(),
            (RegistryContents{L"A", L"A : @ = s 'foreign'", L"A : x = s 'foreign'", L"A\\Foreign"}));
}

TEST_F(Registrar, UnregisteringDeletesUnmarkedKeysFromTheBottomUp) {
  MakeKey(L"A\\B\\C", {L""});
  ASSERT_EQ(Unregister("HKCR { A { B { C = s 'text' } } }"), S_OK);
  EXPECT_EQ(Contents(), RegistryContents{});
}

TEST_F(Registrar, UnregisteringKeepsAnUnmarkedKeyThatIsNotEmpty) {
  MakeKey(L"HasSubkey\\Foreign");
  MakeKey(L"HasValue", {L"x"});
  MakeKey(L"HasDefault", {L""});
  const RegistryContents before = Contents();
  ASSERT_EQ(Unregister("HKCR { HasSubkey HasValue = s 'text' HasDefault }"), S_OK);
  EXPECT_EQ(Contents(), before);
}

TEST_F(Registrar, UnregisteringCreatesNothing) {
  ASSERT_EQ(Unregister("HKCR { NoRemove A { val B = s 'text' ForceRemove C D { val E = d '1' } } }"), S_OK);
  EXPECT_EQ(registry_.Contents(), RegistryContents{});
}

TEST_F(Registrar, NeverDeletesAKeyThatManyProgramsShare) {
  for (const std::string name :
       {"AppID", "CLSID", "Component Categories", "FileType", "Interface", "Hardware", "Mime", "SAM",
        "SECURITY", "SYSTEM", "Software", "TypeLib", "clsid", "SOFTWARE", "system"}) {
    const std::wstring wide(name.begin(), name.end());
    registry_ = MemoryRegistry();
    MakeKey(L"Around\\" + wide, {L"ours"});
    const std::string script = "HKCR { Around { '" + name + "' { val Ours = s 'text' } } }";
    ASSERT_EQ(Unregister(script), S_OK);
    EXPECT_EQ(Contents(), (RegistryContents{L"Around", L"Around\\" + wide})) << name;

    MakeKey(L"Around\\" + wide + L"\\Foreign");
    const RegistryContents before = Contents();
    const std::string forceful = "HKCR { Around { ForceRemove '" + name + "' } }";
    ASSERT_EQ(Register(forceful), S_OK);
    EXPECT_EQ(Contents(), before) << name;
    ASSERT_EQ(Unregister(forceful), S_OK);
    EXPECT_EQ(Contents(), before) << name;
  }
}

TEST_F(Registrar, RefusesAnInvalidScriptBeforeAnyChange) {
  MakeKey(L"A\\B");
  const RegistryContents before = Contents();
  for (const char* broken : {"HKCR { ForceRemove A C", "HKCR { ForceRemove A C = s '%UNKNOWN%' }"}) {
    EXPECT_EQ(Register(broken), static_cast<HRESULT>(0x8007000D));
    EXPECT_EQ(Unregister(broken), static_cast<HRESULT>(0x8007000D));
    EXPECT_EQ(Contents(), before);
  }
}

TEST_F(Registrar, StopsAtTheFirstFailureAndReturnsIt) {
  registry_.FailAfter(2);
  EXPECT_EQ(Register("HKCR { A = s 'text' B }"), E_ACCESSDENIED);
  EXPECT_EQ(Contents(), (RegistryContents{L"A", L"A : @ = s 'text'"}));
  registry_.FailAfter(0);
  EXPECT_EQ(Unregister("HKCR { A = s 'text' B }"), E_ACCESSDENIED);
  EXPECT_EQ(Contents(), (RegistryContents{L"A", L"A : @ = s 'text'"}));
}

/// Runs the scripts that the DLL embeds on a registry in memory.
class EmbeddedScripts : public ::testing::Test {
 protected:
  /// The scripts in the order of registration.
  static inline const std::vector<std::string> kRunByRegistration = {"module", "shell_ext", "ebn", "raw",
                                                                     "mrc"};
  /// The scripts in the order of unregistration.
  static inline const std::vector<std::string> kRunByUnregistration = {"shell_ext", "ebn", "raw", "mrc",
                                                                       "module"};
  static inline const std::wstring kPath = L"C:\\QelShellExt.DLL";

  static const std::string& Read(const std::string& name) {
    static std::map<std::string, std::string> scripts;
    std::string& script = scripts[name];
    if (!script.empty()) return script;
    std::ifstream file(name + ".rgs", std::ios::binary);
    EXPECT_TRUE(file) << name;
    return script.assign(std::istreambuf_iterator<char>(file), {});
  }

  HRESULT Run(const std::vector<std::string>& names, ScriptDirection direction, MemoryRegistry& registry) {
    const std::vector<Replacement> replacements = {{L"APPID", L"{66A6E9D4-0F73-4d4a-A7EE-F53AE6C5F868}"},
                                                   {L"Module", kPath}};
    HRESULT result = S_OK;
    for (const std::string& name : names) {
      result = RunRegistryScript(Read(name), replacements, direction, registry);
      if (FAILED(result)) break;
    }
    return result;
  }

  HRESULT Register(MemoryRegistry& registry) {
    return Run(kRunByRegistration, ScriptDirection::kRegister, registry);
  }
  HRESULT Unregister(MemoryRegistry& registry) {
    return Run(kRunByUnregistration, ScriptDirection::kUnregister, registry);
  }

  MemoryRegistry machine_{MemoryRegistry::ClassesRoot::kWithinMachine};
};

TEST_F(EmbeddedScripts, WriteTheExpectedRegistration) {
  ASSERT_EQ(Register(machine_), S_OK);
  EXPECT_TRUE(Testing::Same(machine_.Contents(), Testing::ExpectedAfterRegistering(kPath)));
}

TEST_F(EmbeddedScripts, LeaveOnlyTheKeysThatOthersMayShare) {
  ASSERT_EQ(Register(machine_), S_OK);
  ASSERT_EQ(Unregister(machine_), S_OK);
  EXPECT_TRUE(Testing::Same(machine_.Contents(), Testing::ExpectedAfterUnregistering()));
}

TEST_F(EmbeddedScripts, OneTitleDiffersInTheFirstCopyOfItsClass) {
  MemoryRegistry registry;  // keeps HKCR separate from HKLM
  ASSERT_EQ(Run({"mrc"}, ScriptDirection::kRegister, registry), S_OK);
  const RegistryContents contents = registry.Contents();
  const std::wstring key = L"\\CLSID\\{ADF28042-3A9F-4409-9C62-444B018A7810} : @ = s '";
  EXPECT_TRUE(contents.contains(L"HKCR" + key + L"Qel .MRC Image Property Handler'"));
  EXPECT_TRUE(contents.contains(L"HKCR\\Wow6432Node" + key + L"QEL .MRC Image Property Handler'"));
  EXPECT_TRUE(contents.contains(L"HKLM\\SOFTWARE\\Classes" + key + L"QEL .MRC Image Property Handler'"));
  EXPECT_TRUE(
      contents.contains(L"HKLM\\SOFTWARE\\Classes\\Wow6432Node" + key + L"QEL .MRC Image Property Handler'"));
}

struct PropertyHandler {
  std::string script;
  std::wstring extension;
  std::wstring clsid;
  std::wstring title;
  std::wstring firstTitle = title;
  std::wstring approvedName;
  std::wstring wowApprovedName = approvedName;
};

const std::vector<PropertyHandler>& PropertyHandlers() {
  static const std::vector<PropertyHandler> handlers = {
      {.script = "ali",
       .extension = L".ali",
       .clsid = L"{F9ADF69F-20BB-45A6-ABE6-D833AD51D6AE}",
       .title = L"QEL .ALI Image Property Handler",
       .approvedName = L"QelShellExtVistaAli"},
      {.script = "ebn",
       .extension = L".ebn",
       .clsid = L"{E37DEDA9-F652-401B-B619-A1A88EADD003}",
       .title = L"QEL .EBN Image Property Handler",
       .approvedName = L"QelShellExtVistaEbn"},
      {.script = "emi",
       .extension = L".emi",
       .clsid = L"{F903650A-F2FF-4B8F-8648-E7D8D00D69C7}",
       .title = L"QEL .EMI Image Property Handler",
       .approvedName = L"QelShellExtVistaEmi"},
      {.script = "mrc",
       .extension = L".mrc",
       .clsid = L"{ADF28042-3A9F-4409-9C62-444B018A7810}",
       .title = L"QEL .MRC Image Property Handler",
       .firstTitle = L"Qel .MRC Image Property Handler",
       .approvedName = L"QelShellExtVistaMrc"},
      {.script = "raw",
       .extension = L".raw",
       .clsid = L"{E217E970-5E2E-11E1-B86C-0800200C9A66}",
       .title = L"Qel Raw Image Property Handler",
       .approvedName = L"QelShellExtVista",
       .wowApprovedName = L"QelShellExtVistaRaw"},
      {.script = "rec",
       .extension = L".rec",
       .clsid = L"{FEB98CE0-7F8B-46ED-940E-057F56AE3806}",
       .title = L"QEL .REC Image Property Handler",
       .approvedName = L"QelShellExtVistaRec"},
      {.script = "ser",
       .extension = L".ser",
       .clsid = L"{DF388BD2-0855-4D1A-9E9A-05F6A13DBC81}",
       .title = L"QEL .SER Image Property Handler",
       .approvedName = L"QelShellExtVistaSer"},
  };
  return handlers;
}

TEST_F(EmbeddedScripts, EveryPropertyHandlerScriptHasTheSameStructure) {
  const std::wstring properties =
      L"prop:System.Image.HorizontalSize;System.Image.VerticalSize;System.Image.BitDepth;"
      L"System.Media.FrameCount;System.Image.Dimensions;System.Comment";

  for (const PropertyHandler& handler : PropertyHandlers()) {
    MemoryRegistry registry;
    ASSERT_EQ(Run({handler.script}, ScriptDirection::kRegister, registry), S_OK);

    RegistryContents expected;
    AddKey(expected, L"HKCR\\" + handler.extension,
           {{L"FullDetails", properties},
            {L"InfoTip", properties},
            {L"PreviewDetails", properties},
            {L"PreviewTitle", properties}});
    for (const std::wstring classes : {L"HKCR", L"HKCR\\Wow6432Node", L"HKLM\\SOFTWARE\\Classes",
                                       L"HKLM\\SOFTWARE\\Classes\\Wow6432Node"}) {
      const std::wstring key = classes + L"\\CLSID\\" + handler.clsid;
      AddKey(expected, key,
             {{L"", classes == L"HKCR" ? handler.firstTitle : handler.title}, {L"ManualSafeSave", 1u}});
      AddKey(expected, key + L"\\InProcServer32", {{L"", kPath}, {L"ThreadingModel", L"Both"}});
    }
    for (const bool isWow : {false, true}) {
      const std::wstring windows = std::wstring(L"HKLM\\SOFTWARE") + (isWow ? L"\\Wow6432Node" : L"") +
                                   L"\\Microsoft\\Windows\\CurrentVersion";
      AddKey(expected, windows + L"\\PropertySystem\\PropertyHandlers\\" + handler.extension,
             {{L"", handler.clsid}});
      AddKey(expected, windows + L"\\Shell Extensions\\Approved",
             {{handler.clsid, isWow ? handler.wowApprovedName : handler.approvedName}});
    }
    EXPECT_TRUE(Testing::Same(registry.Contents(), expected)) << handler.script;
  }
}

TEST_F(EmbeddedScripts, EveryPropertyHandlerScriptRemovesItsOwnEntriesAndNothingElse) {
  for (const PropertyHandler& handler : PropertyHandlers()) {
    MemoryRegistry registry;
    ASSERT_EQ(Run({handler.script}, ScriptDirection::kRegister, registry), S_OK);
    RegistryContents expected;
    for (const std::wstring path : {L"", L"Wow6432Node\\"}) {
      ASSERT_EQ(registry.CreateKey(kClassesRoot, path + L"CLSID\\" + handler.clsid + L"\\Stale"), S_OK);
      ASSERT_EQ(registry.CreateKey(kLocalMachine,
                                   L"SOFTWARE\\Classes\\" + path + L"CLSID\\" + handler.clsid + L"\\Stale"),
                S_OK);
      AddKey(expected, L"HKCR\\" + path + L"CLSID", {});
      AddKey(expected, L"HKLM\\SOFTWARE\\Classes\\" + path + L"CLSID", {});
      const std::wstring windows = L"HKLM\\SOFTWARE\\" + path + L"Microsoft\\Windows\\CurrentVersion";
      AddKey(expected, windows + L"\\PropertySystem\\PropertyHandlers", {});
      AddKey(expected, windows + L"\\Shell Extensions\\Approved", {});
    }
    AddKey(expected, L"HKCR\\" + handler.extension, {});
    ASSERT_EQ(Run({handler.script}, ScriptDirection::kUnregister, registry), S_OK);
    EXPECT_TRUE(Testing::Same(registry.Contents(), expected)) << handler.script;

    // The key of the file-name extension remains if another program has a value in it.
    ASSERT_EQ(Run({handler.script}, ScriptDirection::kRegister, registry), S_OK);
    const std::wstring key =
        L"SOFTWARE\\Microsoft\\Windows\\CurrentVersion\\PropertySystem\\PropertyHandlers\\" +
        handler.extension;
    ASSERT_EQ(registry.SetValue(kLocalMachine, key, L"Foreign", std::wstring(L"foreign")), S_OK);
    ASSERT_EQ(Run({handler.script}, ScriptDirection::kUnregister, registry), S_OK);
    AddKey(expected, L"HKLM\\" + key, {{L"", handler.clsid}, {L"Foreign", L"foreign"}});
    EXPECT_TRUE(Testing::Same(registry.Contents(), expected)) << handler.script;
  }
}

TEST_F(EmbeddedScripts, RegisteringAgainRepairsARegistrationThatFailedAtAnyChange) {
  ASSERT_EQ(Register(machine_), S_OK);
  const RegistryContents complete = machine_.Contents();
  ASSERT_EQ(Unregister(machine_), S_OK);
  const RegistryContents leftOver = machine_.Contents();

  HRESULT result = E_ACCESSDENIED;
  for (std::size_t changes = 0; FAILED(result); ++changes) {
    MemoryRegistry repaired(MemoryRegistry::ClassesRoot::kWithinMachine);
    repaired.FailAfter(changes);
    result = Register(repaired);
    MemoryRegistry removed = repaired;
    repaired.NeverFail();
    removed.NeverFail();

    ASSERT_EQ(Register(repaired), S_OK);
    EXPECT_TRUE(Testing::Same(repaired.Contents(), complete)) << changes;

    ASSERT_EQ(Unregister(removed), S_OK);
    EXPECT_EQ(Testing::Without(removed.Contents(), leftOver), RegistryContents{}) << changes;
  }
}

TEST_F(EmbeddedScripts, UnregisteringAgainCompletesAnUnregistrationThatFailedAtAnyChange) {
  HRESULT result = E_ACCESSDENIED;
  for (std::size_t changes = 0; FAILED(result); ++changes) {
    MemoryRegistry registry(MemoryRegistry::ClassesRoot::kWithinMachine);
    ASSERT_EQ(Register(registry), S_OK);
    registry.FailAfter(changes);
    result = Unregister(registry);
    registry.NeverFail();
    ASSERT_EQ(Unregister(registry), S_OK);
    // The first run stops at the keys of the approved list, because the values of later scripts are still
    // there. Once all of these values are gone, another run deletes the keys, as they are not marked
    // NoRemove.
    const RegistryContents atMost = Testing::ExpectedAfterUnregistering();
    RegistryContents atLeast = atMost;
    const std::wstring approved = L"HKLM\\Software\\Microsoft\\Windows\\CurrentVersion\\Shell Extensions";
    atLeast.erase(approved);
    atLeast.erase(approved + L"\\Approved");
    EXPECT_EQ(Testing::Without(registry.Contents(), atMost), RegistryContents{}) << changes;
    EXPECT_EQ(Testing::Without(atLeast, registry.Contents()), RegistryContents{}) << changes;
  }
}

}  // namespace
}  // namespace Qel::Lumetra::ShellExt
