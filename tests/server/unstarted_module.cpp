#include "unstarted_module.h"

#include <array>
#include <cstdint>
#include <cstring>
#include <stdexcept>

namespace Qel::Lumetra::ShellExt::Testing {
namespace {

constexpr std::size_t kMaxStubs = 1024;

template <class T>
T* At(HMODULE module, std::size_t offset) {
  return reinterpret_cast<T*>(reinterpret_cast<char*>(module) + offset);
}

const IMAGE_NT_HEADERS64& Headers(HMODULE module) {
  return *At<IMAGE_NT_HEADERS64>(module, static_cast<std::size_t>(At<IMAGE_DOS_HEADER>(module, 0)->e_lfanew));
}

/// Returns whether an import is code. Variables are imported too, and must not be replaced by code.
bool IsFunction(const void* address) {
  MEMORY_BASIC_INFORMATION memory{};
  VirtualQuery(address, &memory, sizeof memory);
  return (memory.Protect &
          (PAGE_EXECUTE | PAGE_EXECUTE_READ | PAGE_EXECUTE_READWRITE | PAGE_EXECUTE_WRITECOPY)) != 0;
}

}  // namespace

/// Counts a call and jumps to the function, with all arguments unchanged:
///
///   lock inc qword [calls]
///   jmp [function]
struct UnstartedModule::Stub {
  std::array<unsigned char, 16> code = {0xF0, 0x48, 0xFF, 0x05, 8, 0, 0, 0, 0xFF, 0x25, 10, 0, 0, 0};
  std::int64_t calls = 0;
  void* function = nullptr;
};

UnstartedModule::UnstartedModule(const std::filesystem::path& dll)
    : module_(LoadLibraryExW(dll.c_str(), nullptr, DONT_RESOLVE_DLL_REFERENCES)) {
  if (module_ == nullptr) throw std::runtime_error(dll.string() + " cannot be mapped");
  static_assert(offsetof(Stub, calls) == 8 + 8 && offsetof(Stub, function) == 14 + 10);
  stubs_ = static_cast<Stub*>(
      VirtualAlloc(nullptr, kMaxStubs * sizeof(Stub), MEM_COMMIT | MEM_RESERVE, PAGE_EXECUTE_READWRITE));
  if (stubs_ == nullptr) throw std::runtime_error("there is no memory for code");
  BindImports();
}

UnstartedModule::~UnstartedModule() {
  FreeLibrary(module_);
  for (const HMODULE library : libraries_) FreeLibrary(library);
  VirtualFree(stubs_, 0, MEM_RELEASE);
}

BOOL UnstartedModule::Notify(DWORD reason) {
  using EntryPoint = BOOL WINAPI(HINSTANCE, DWORD, void*);
  return At<EntryPoint>(module_, Headers(module_).OptionalHeader.AddressOfEntryPoint)(module_, reason,
                                                                                      nullptr);
}

std::map<std::string, int> UnstartedModule::TakeCalls() {
  std::map<std::string, int> calls;
  for (std::size_t i = 0; i < count_; ++i) {
    if (stubs_[i].calls != 0) calls[names_[i]] += static_cast<int>(stubs_[i].calls);
    stubs_[i].calls = 0;
  }
  return calls;
}

void UnstartedModule::BindImports() {
  const auto& directory = Headers(module_).OptionalHeader.DataDirectory[IMAGE_DIRECTORY_ENTRY_IMPORT];
  const auto* library = At<IMAGE_IMPORT_DESCRIPTOR>(module_, directory.VirtualAddress);
  for (; library->Name != 0; ++library) {
    const char* const libraryName = At<char>(module_, library->Name);
    libraries_.push_back(LoadLibraryA(libraryName));
    const auto* names = At<std::uint64_t>(module_, library->OriginalFirstThunk);
    for (auto* slot = At<void*>(module_, library->FirstThunk); *names != 0; ++names, ++slot) {
      const char* const name = At<IMAGE_IMPORT_BY_NAME>(module_, static_cast<std::size_t>(*names))->Name;
      const auto function = reinterpret_cast<void*>(GetProcAddress(libraries_.back(), name));
      if (function == nullptr || count_ == kMaxStubs) {
        throw std::runtime_error(std::string("cannot bind ") + name + " of " + libraryName);
      }
      void* bound = function;
      if (IsFunction(function)) {
        stubs_[count_] = {.function = function};
        bound = &stubs_[count_++];
        names_.emplace_back(name);
      }
      DWORD protection = 0;
      VirtualProtect(slot, sizeof bound, PAGE_READWRITE, &protection);
      *slot = bound;
      VirtualProtect(slot, sizeof bound, protection, &protection);
    }
  }
}

}  // namespace Qel::Lumetra::ShellExt::Testing
