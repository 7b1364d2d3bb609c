#include "object_map.h"

#include <array>

#include "class_ids.h"
#include "property_store.h"
#include "shell_ext.h"

namespace Qel::Lumetra::ShellExt {

std::span<ObjectMapEntry> ObjectMap() {
  using Com::MakeClassFactory;
  using Com::MakeInstance;
  static constinit std::array<ObjectMapEntry, 4> map{{
      {&CLSID_QelShellExt, 102, &MakeClassFactory, &MakeInstance<CShellExt>},
      {&CLSID_QelShellExtVistaEbn, 104, &MakeClassFactory, &MakeInstance<CShellExtVistaEbn>},
      {&CLSID_QelShellExtVistaRaw, 107, &MakeClassFactory, &MakeInstance<CShellExtVistaRaw>},
      {&CLSID_QelShellExtVistaMrc, 106, &MakeClassFactory, &MakeInstance<CShellExtVistaMrc>},
  }};
  return map;
}

}  // namespace Qel::Lumetra::ShellExt
