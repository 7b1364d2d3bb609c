#include "object_map.h"

#include <array>

#include "class_ids.h"
#include "property_store.h"
#include "script_ids.h"
#include "shell_ext.h"

namespace Qel::Lumetra::ShellExt {

std::span<ObjectMapEntry> ObjectMap() {
  using Com::MakeClassFactory;
  using Com::MakeInstance;
  static constinit std::array<ObjectMapEntry, 4> map{{
      {&CLSID_QelShellExt, IDR_SHELL_EXT, &MakeClassFactory, &MakeInstance<CShellExt>},
      {&CLSID_QelShellExtVistaEbn, IDR_EBN, &MakeClassFactory, &MakeInstance<CShellExtVistaEbn>},
      {&CLSID_QelShellExtVistaRaw, IDR_RAW, &MakeClassFactory, &MakeInstance<CShellExtVistaRaw>},
      {&CLSID_QelShellExtVistaMrc, IDR_MRC, &MakeClassFactory, &MakeInstance<CShellExtVistaMrc>},
  }};
  return map;
}

}  // namespace Qel::Lumetra::ShellExt
