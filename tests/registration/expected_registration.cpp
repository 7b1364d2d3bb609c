#include "expected_registration.h"

#include "file_kinds.h"

namespace Qel::Lumetra::ShellExt::Testing {
namespace {

const std::wstring kClasses = L"HKLM\\Software\\Classes";
const std::wstring kWowClasses = kClasses + L"\\Wow6432Node";
const std::wstring kWindows = L"HKLM\\Software\\Microsoft\\Windows\\CurrentVersion";
const std::wstring kWowWindows = L"HKLM\\Software\\Wow6432Node\\Microsoft\\Windows\\CurrentVersion";

const std::wstring kAppId = L"{66A6E9D4-0F73-4d4a-A7EE-F53AE6C5F868}";
const std::wstring kShellExt = L"{79E696A1-2FA5-4b3e-9610-D5F760417E62}";

const std::wstring kPropertyList =
    L"prop:System.Image.HorizontalSize;System.Image.VerticalSize;System.Image.BitDepth;"
    L"System.Media.FrameCount;System.Image.Dimensions;System.Comment";

struct PropertyHandler {
  std::wstring extension;
  std::wstring clsid;
  std::wstring title;
  std::wstring approvedName;
  std::wstring wowApprovedName;
};

// HKCR\CLSID and HKLM\Software\Classes\CLSID are the same key. The scripts write each class key twice, and
// the second copy replaces the first, so the title of the .mrc class is that of the second copy.
const PropertyHandler kPropertyHandlers[] = {
    {L".ebn", L"{E37DEDA9-F652-401B-B619-A1A88EADD003}", L"QEL .EBN Image Property Handler",
     L"QelShellExtVistaEbn", L"QelShellExtVistaEbn"},
    {L".raw", L"{E217E970-5E2E-11E1-B86C-0800200C9A66}", L"Qel Raw Image Property Handler",
     L"QelShellExtVista", L"QelShellExtVistaRaw"},
    {L".mrc", L"{ADF28042-3A9F-4409-9C62-444B018A7810}", L"QEL .MRC Image Property Handler",
     L"QelShellExtVistaMrc", L"QelShellExtVistaMrc"},
};

}  // namespace

RegistryContents ExpectedAfterRegistering(const std::wstring& path) {
  RegistryContents all;

  AddKey(all, kClasses + L"\\AppID\\" + kAppId, {{L"", L"QelShellExt"}});
  AddKey(all, kClasses + L"\\AppID\\Brisel.DLL", {{L"AppID", kAppId}});

  AddKey(all, kClasses + L"\\QEL.ShellExt.1", {{L"", L"QelShellExt Class"}});
  AddKey(all, kClasses + L"\\QEL.ShellExt.1\\CLSID", {{L"", kShellExt}});
  AddKey(all, kClasses + L"\\QEL.ShellExt", {{L"", L"QelShellExt Class"}});
  AddKey(all, kClasses + L"\\QEL.ShellExt\\CLSID", {{L"", kShellExt}});
  AddKey(all, kClasses + L"\\QEL.ShellExt\\CurVer", {{L"", L"QEL.ShellExt.1"}});

  const std::wstring shellExt = kClasses + L"\\CLSID\\" + kShellExt;
  AddKey(all, shellExt, {{L"", L"QelShellExt Class"}, {L"AppID", kAppId}});
  AddKey(all, shellExt + L"\\ProgID", {{L"", L"QEL.ShellExt.1"}});
  AddKey(all, shellExt + L"\\VersionIndependentProgID", {{L"", L"QEL.ShellExt"}});
  AddKey(all, shellExt + L"\\Programmable");
  AddKey(all, shellExt + L"\\InprocServer32", {{L"", path}, {L"ThreadingModel", L"Apartment"}});
  AddKey(all, kWindows + L"\\Shell Extensions\\Approved", {{kShellExt, L"QelShellExt"}});

  for (const std::wstring_view extension : kExtensions) {
    const std::wstring handlers = kClasses + L"\\." + std::wstring(extension) + L"\\ShellEx\\";
    AddKey(all, handlers + L"{BB2E617C-0920-11d1-9A0B-00C04FC2D6C1}", {{L"", kShellExt}});
    AddKey(all, handlers + L"{00021500-0000-0000-C000-000000000046}", {{L"", kShellExt}});
    AddKey(all, handlers + L"PropertyHandler", {{L"", kShellExt}});
  }

  for (const PropertyHandler& handler : kPropertyHandlers) {
    AddKey(all, kClasses + L"\\" + handler.extension,
           {{L"FullDetails", kPropertyList},
            {L"InfoTip", kPropertyList},
            {L"PreviewDetails", kPropertyList},
            {L"PreviewTitle", kPropertyList}});
    for (const std::wstring& classes : {kClasses, kWowClasses}) {
      const std::wstring key = classes + L"\\CLSID\\" + handler.clsid;
      AddKey(all, key, {{L"", handler.title}, {L"ManualSafeSave", 1u}});
      AddKey(all, key + L"\\InProcServer32", {{L"", path}, {L"ThreadingModel", L"Both"}});
    }
    for (const std::wstring& windows : {kWindows, kWowWindows}) {
      AddKey(all, windows + L"\\PropertySystem\\PropertyHandlers\\" + handler.extension,
             {{L"", handler.clsid}});
    }
    AddKey(all, kWindows + L"\\Shell Extensions\\Approved", {{handler.clsid, handler.approvedName}});
    AddKey(all, kWowWindows + L"\\Shell Extensions\\Approved", {{handler.clsid, handler.wowApprovedName}});
  }
  return all;
}

RegistryContents ExpectedAfterUnregistering() {
  RegistryContents all;
  AddKey(all, kClasses + L"\\AppID");
  AddKey(all, kClasses + L"\\CLSID");
  AddKey(all, kWowClasses + L"\\CLSID");

  // A key named CLSID is never deleted, so the ProgID keys that contain one remain.
  AddKey(all, kClasses + L"\\QEL.ShellExt.1", {{L"", L"QelShellExt Class"}});
  AddKey(all, kClasses + L"\\QEL.ShellExt.1\\CLSID", {{L"", kShellExt}});
  AddKey(all, kClasses + L"\\QEL.ShellExt", {{L"", L"QelShellExt Class"}});
  AddKey(all, kClasses + L"\\QEL.ShellExt\\CLSID", {{L"", kShellExt}});

  for (const std::wstring_view extension : kExtensions) {
    AddKey(all, kClasses + L"\\." + std::wstring(extension) + L"\\ShellEx");
  }

  for (const std::wstring& windows : {kWindows, kWowWindows}) {
    AddKey(all, windows + L"\\PropertySystem\\PropertyHandlers");
    AddKey(all, windows + L"\\Shell Extensions\\Approved");
  }
  return all;
}

}  // namespace Qel::Lumetra::ShellExt::Testing
