// The fuzzer of the registrar. The input is a registry script, which is parsed, registered in a registry in
// memory and unregistered again.
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <string_view>

#include "memory_registry.h"
#include "registrar.h"

namespace {

using namespace Qel::Lumetra::ShellExt;
using Testing::MemoryRegistry;

void Require(bool condition, const char* what) {
  if (condition) return;
  std::fprintf(stderr, "%s\n", what);
  std::abort();
}

void CheckKeys(const RegistryScript& script) {
  std::size_t maxDepth = 0;  // of the next key
  for (const ScriptKey& key : script) {
    Require(key.depth <= maxDepth, "a key has no parent");
    Require(key.depth < kMaxKeyNesting, "a key is nested too deeply");
    Require(!key.name.empty() && key.name.find(L'\\') == std::wstring::npos, "a key has an invalid name");
    maxDepth = key.depth + 1;
  }
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  static const Replacement kReplacements[] = {{L"APPID", L"{66A6E9D4-0F73-4d4a-A7EE-F53AE6C5F868}"},
                                              {L"MODULE", L"C:\\it''s\\here.dll"},
                                              {L"", L"%"}};
  const std::string_view text(reinterpret_cast<const char*>(data), size);
  const auto script = ParseRegistryScript(text, kReplacements);
  if (script) CheckKeys(*script);

  for (const auto place :
       {MemoryRegistry::ClassesRoot::kApart, MemoryRegistry::ClassesRoot::kWithinMachine}) {
    MemoryRegistry registry(place);
    const auto run = [&](ScriptDirection direction) {
      return RunRegistryScript(text, kReplacements, direction, registry);
    };
    const HRESULT expected = script ? S_OK : kInvalidScript;
    Require(run(ScriptDirection::kRegister) == expected, "the results of registering and parsing differ");
    const auto once = registry.Contents();
    Require(script || once.empty(), "an invalid script changes the registry");
    run(ScriptDirection::kRegister);
    Require(registry.Contents() == once, "registering again changes the registry");
    Require(run(ScriptDirection::kUnregister) == expected, "unregistering fails");
    Require(run(ScriptDirection::kUnregister) == expected, "unregistering again fails");
  }
  return 0;
}
