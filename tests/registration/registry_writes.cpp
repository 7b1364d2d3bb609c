#include "registry_writes.h"

#include <utility>

namespace Qel::Lumetra::ShellExt::Testing {
namespace {

RegistryWrites* g_current = nullptr;

/// Returns the result that the test decides on; calls the function if that is ERROR_SUCCESS.
template <auto kFunction, class... Arguments>
LSTATUS WINAPI Asked(Arguments... arguments) {
  const LSTATUS answer = RegistryWrites::AskCurrent();
  return answer == ERROR_SUCCESS ? kFunction(arguments...) : answer;
}

template <auto kFunction, class... Arguments>
ImportPatch Patch(HMODULE module, const char* name, LSTATUS(WINAPI*)(Arguments...)) {
  return {module, name, &Asked<kFunction, Arguments...>};
}

}  // namespace

RegistryWrites::RegistryWrites(HMODULE module, Decide decide)
    : decide_(std::move(decide)),
      patches_{Patch<&RegCreateKeyExW>(module, "RegCreateKeyExW", &RegCreateKeyExW),
               Patch<&RegSetValueExW>(module, "RegSetValueExW", &RegSetValueExW),
               Patch<&RegDeleteTreeW>(module, "RegDeleteTreeW", &RegDeleteTreeW),
               Patch<&RegDeleteValueW>(module, "RegDeleteValueW", &RegDeleteValueW),
               Patch<&RegDeleteKeyExW>(module, "RegDeleteKeyExW", &RegDeleteKeyExW)} {
  g_current = this;
}

RegistryWrites::~RegistryWrites() {
  g_current = nullptr;
}

LSTATUS RegistryWrites::AskCurrent() {
  return g_current->decide_(g_current->count_++);
}

}  // namespace Qel::Lumetra::ShellExt::Testing
