#include "import_patch.h"

#include <cstdint>
#include <stdexcept>
#include <string>
#include <string_view>

namespace Qel::Lumetra::ShellExt::Testing {
namespace {

template <class T>
const T* At(HMODULE module, std::size_t offset) {
  return reinterpret_cast<const T*>(reinterpret_cast<const char*>(module) + offset);
}

/// Returns the slot in the module's import address table through which it calls the function; null if there
/// is none.
void** FindSlot(HMODULE module, std::string_view name) {
  const auto* dos = At<IMAGE_DOS_HEADER>(module, 0);
  const auto* headers = At<IMAGE_NT_HEADERS64>(module, static_cast<std::size_t>(dos->e_lfanew));
  const auto& directory = headers->OptionalHeader.DataDirectory[IMAGE_DIRECTORY_ENTRY_IMPORT];
  if (directory.Size == 0) return nullptr;

  const auto* library = At<IMAGE_IMPORT_DESCRIPTOR>(module, directory.VirtualAddress);
  for (; library->Name != 0; ++library) {
    const auto* names = At<std::uint64_t>(module, library->OriginalFirstThunk);
    for (std::size_t i = 0; names[i] != 0; ++i) {
      if (IMAGE_SNAP_BY_ORDINAL64(names[i])) continue;
      const auto* import = At<IMAGE_IMPORT_BY_NAME>(module, static_cast<std::size_t>(names[i]));
      if (name != reinterpret_cast<const char*>(import->Name)) continue;
      return const_cast<void**>(At<void*>(module, library->FirstThunk + i * sizeof(void*)));
    }
  }
  return nullptr;
}

void Write(void** slot, void* function) {
  DWORD protection = 0;
  VirtualProtect(slot, sizeof(*slot), PAGE_READWRITE, &protection);
  *slot = function;
  VirtualProtect(slot, sizeof(*slot), protection, &protection);
}

}  // namespace

ImportPatch::ImportPatch(HMODULE module, const char* name, void* replacement)
    : slot_(FindSlot(module, name)) {
  if (!slot_) throw std::runtime_error(std::string("the module does not import ") + name);
  original_ = *slot_;
  Write(slot_, replacement);
}

ImportPatch::~ImportPatch() {
  Write(slot_, original_);
}

}  // namespace Qel::Lumetra::ShellExt::Testing
