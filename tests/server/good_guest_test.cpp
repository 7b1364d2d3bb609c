// Tests the release DLL as a guest in another program's process: what it requests of the process, and that it
// releases all of it.
#include <gtest/gtest.h>
#include <windows.h>

#include <algorithm>
#include <cstdint>
#include <cstring>
#include <string>
#include <thread>
#include <vector>

#include "ebn_file.h"
#include "emi_file.h"
#include "every_request.h"
#include "mrc_file.h"
#include "portable_executable.h"
#include "process_census.h"
#include "raw_file.h"
#include "ser_file.h"
#include "server_dll.h"
#include "temp_folder.h"

namespace Qel::Lumetra::ShellExt::Testing {
namespace {

using namespace std::string_literals;
using testing::AssertionResult;

TEST(ReleaseDll, ExportsFourUndecoratedFunctions) {
  const auto module = PortableExecutable::Read(ServerDll::Path());
  EXPECT_EQ(module.exports, (std::vector<std::string>{"DllCanUnloadNow", "DllGetClassObject",
                                                      "DllRegisterServer", "DllUnregisterServer"}));
  EXPECT_EQ(module.exportedName, "QelShellExt.DLL");
}

TEST(ReleaseDll, ImportsFromTheSystemsOwnModulesOnly) {
  for (const auto& [name, functions] : PortableExecutable::Read(ServerDll::Path()).imports) {
    const std::vector<std::string> system = {"advapi32.dll", "gdi32.dll",   "kernel32.dll",
                                             "msvcrt.dll",   "ole32.dll",   "oleaut32.dll",
                                             "shell32.dll",  "shlwapi.dll", "user32.dll"};
    EXPECT_NE(std::ranges::find(system, name), system.end()) << name;
  }
}

TEST(ReleaseDll, ImportsNothingThatCouldOutliveIt) {
  // Among others, functions that create threads, process-wide exception handlers, or thread-local or
  // fiber-local slots.
  for (const auto& [name, functions] : PortableExecutable::Read(ServerDll::Path()).imports) {
    for (const char* const function :
         {"createthread", "_beginthreadex", "addvectoredexceptionhandler", "setunhandledexceptionfilter",
          "tlsalloc", "flsalloc", "setwindowshookexw", "createeventa", "createsemaphorea", "suspendthread"}) {
      EXPECT_FALSE(functions.contains(function)) << name << " " << function;
    }
  }
}

TEST(ReleaseDll, IsHardened) {
  const auto module = PortableExecutable::Read(ServerDll::Path());
  EXPECT_EQ(module.machine, IMAGE_FILE_MACHINE_AMD64);
  EXPECT_TRUE(module.fileCharacteristics & IMAGE_FILE_DLL);
  EXPECT_FALSE(module.fileCharacteristics & IMAGE_FILE_RELOCS_STRIPPED);
  EXPECT_TRUE(module.dllCharacteristics & IMAGE_DLLCHARACTERISTICS_DYNAMIC_BASE);
  EXPECT_TRUE(module.dllCharacteristics & IMAGE_DLLCHARACTERISTICS_NX_COMPAT);
  EXPECT_TRUE(module.dllCharacteristics & 0x20);  // HIGH_ENTROPY_VA
  EXPECT_FALSE(module.sections.empty());
  for (const auto& section : module.sections) {
    EXPECT_FALSE((section.characteristics & IMAGE_SCN_MEM_WRITE) != 0 &&
                 (section.characteristics & IMAGE_SCN_MEM_EXECUTE) != 0)
        << section.name;
  }
}

TEST(ReleaseDll, IsProtectedAgainstStackOverruns) {
  const std::string code = PortableExecutable::Read(ServerDll::Path()).code;
  // The code that ends the process when a function finds its stack overrun: mov ecx, 2; int 29h.
  const std::size_t end = code.find("\xB9\x02\0\0\0\xCD\x29"s);
  ASSERT_NE(end, std::string::npos);
  // Every protected function calls it.
  int calls = 0;
  for (std::size_t i = code.find('\xE8'); i != std::string::npos && i + 5 <= code.size();
       i = code.find('\xE8', i + 1)) {
    std::int32_t distance = 0;
    std::memcpy(&distance, code.data() + i + 1, sizeof distance);
    if (static_cast<std::int64_t>(i) + 5 + distance == static_cast<std::int64_t>(end)) ++calls;
  }
  EXPECT_GT(calls, 50);
}

/// Returns a string of the version resource.
std::wstring VersionText(const std::vector<char>& resource, const std::wstring& name) {
  void* text = nullptr;
  UINT length = 0;
  VerQueryValueW(resource.data(), (L"\\StringFileInfo\\040904B0\\" + name).c_str(), &text, &length);
  return text == nullptr ? L"" : static_cast<const wchar_t*>(text);
}

TEST(ReleaseDll, HasItsProductDescriptionAndVersionInItsResource) {
  const std::wstring path = ServerDll::Path().wstring();
  std::vector<char> resource(GetFileVersionInfoSizeW(path.c_str(), nullptr));
  ASSERT_TRUE(GetFileVersionInfoW(path.c_str(), 0, static_cast<DWORD>(resource.size()), resource.data()));
  EXPECT_EQ(VersionText(resource, L"ProductName"), L"QelShellExt");
  EXPECT_EQ(VersionText(resource, L"FileDescription"),
            L"Thumbnails and properties of electron-microscopy images");
  EXPECT_EQ(VersionText(resource, L"OriginalFilename"), L"QelShellExt.DLL");
  EXPECT_EQ(VersionText(resource, L"ProductVersion"), L"" QEL_VERSION);
  EXPECT_EQ(VersionText(resource, L"FileVersion"), L"" QEL_VERSION);

  void* numbers = nullptr;
  UINT length = 0;
  ASSERT_TRUE(VerQueryValueW(resource.data(), L"\\", &numbers, &length));
  const auto& fixed = *static_cast<const VS_FIXEDFILEINFO*>(numbers);
  EXPECT_EQ(std::to_string(HIWORD(fixed.dwFileVersionMS)) + "." +
                std::to_string(LOWORD(fixed.dwFileVersionMS)) + "." +
                std::to_string(HIWORD(fixed.dwFileVersionLS)),
            QEL_VERSION);
  EXPECT_EQ(fixed.dwProductVersionMS, fixed.dwFileVersionMS);
  EXPECT_EQ(fixed.dwProductVersionLS, fixed.dwFileVersionLS);
}

TEST(ReleaseDll, HasNoBuildTime) {
  EXPECT_EQ(PortableExecutable::Read(ServerDll::Path()).timeStamp, 0u);
}

/// Writes intact and damaged files of every kind. Returns their paths.
std::vector<std::filesystem::path> WriteFiles(const TempFolder& folder) {
  std::vector<std::filesystem::path> files;
  const auto write = [&](const char* name, const std::string& bytes) {
    files.push_back(folder.Write(name, bytes));
  };
  const std::string pixels(16 * 16 * 16, '\7');

  MrcFile mrc;
  mrc.nx = mrc.ny = 16;
  mrc.nz = 3;
  mrc.labels = {"A label"};
  mrc.pixels = pixels;
  for (const std::int32_t mode : {0, 1, 2, 3, 4, 6, 16}) {
    mrc.mode = mode;
    write(("mode" + std::to_string(mode) + ".mrc").c_str(), mrc.Bytes());
  }
  write("cut.ali", mrc.Bytes().substr(0, 1100));
  write("short.rec", mrc.Bytes().substr(0, 1000));

  write("grey.raw", PackedRawFile(DataType::kUInt16, 16, 16, pixels).Bytes());
  write("colour.raw", PackedRawFile(DataType::kBgr24, 16, 16, pixels).Bytes());
  write("complex.raw", PackedRawFile(DataType::kComplexFloat64, 16, 16, pixels).Bytes());
  write("short.raw", PackedRawFile(DataType::kUInt16, 16, 16, "").Bytes());

  EbnFile ebn;
  ebn.width = ebn.height = 16;
  ebn.afterHeader = pixels;
  write("intact.ebn", ebn.Bytes());
  write("short.ebn", ebn.Bytes().substr(0, 40));

  SerElement element;
  element.width = element.height = 16;
  element.pixels = pixels;
  SerFile ser;
  ser.elements = {element, element};
  write("intact.ser", ser.Bytes());
  ser.dimensions[0].unitsLength = -1;
  write("throwing.ser", ser.Bytes());

  EmiFile emi = OneImageEmiFile(0x2202, 16, 16, pixels);
  write("intact.emi", emi.Bytes());
  write("short.emi", emi.Bytes().substr(0, 20));
  emi.items = EmiArray(0x2202, 0x0202, pixels);
  write("throwing.emi", emi.Bytes());

  write("unknown.tif", pixels);
  files.push_back(folder.path() / "missing.mrc");
  return files;
}

class Unloading : public testing::Test {
 protected:
  // Keeps the modules that the DLL imports loaded, as they are in a shell, so that only the DLL is loaded and
  // unloaded.
  Unloading() {
    for (const auto& [name, functions] : PortableExecutable::Read(ServerDll::Path()).imports) {
      system_.push_back(LoadLibraryA(name.c_str()));
    }
    CoInitializeEx(nullptr, COINIT_APARTMENTTHREADED);
  }

  ~Unloading() override {
    CoUninitialize();
    for (const HMODULE module : system_) FreeLibrary(module);
  }

  /// Loads the DLL, sends it every request for `file`, and unloads it. Returns the number of exceptions.
  int Cycle(const std::filesystem::path& file) {
    const ServerDll dll;
    const int exceptions = MakeEveryRequest(dll, file);
    EXPECT_EQ(dll.CanUnloadNow(), S_OK);
    return exceptions;
  }

 private:
  std::vector<HMODULE> system_;
};

/// Returns success if no count has grown.
AssertionResult NothingIsLeft(const ProcessCensus& before, const ProcessCensus& after) {
  const auto grown = [](std::size_t from, std::size_t to) { return to > from ? to - from : 0; };
  const std::size_t blocks = grown(before.heapBlocks, after.heapBlocks);
  const std::size_t bytes = grown(before.heapBytes, after.heapBytes);
  const std::size_t threadSlots = grown(before.threadSlots, after.threadSlots);
  const std::size_t fiberSlots = grown(before.fiberSlots, after.fiberSlots);
  const std::size_t handles = grown(before.handles, after.handles);
  const std::size_t gdiObjects = grown(before.gdiObjects, after.gdiObjects);
  if (blocks + bytes + threadSlots + fiberSlots + handles + gdiObjects == 0) {
    return testing::AssertionSuccess();
  }
  return testing::AssertionFailure() << blocks << " blocks, " << bytes << " bytes, " << threadSlots
                                     << " thread-local slots, " << fiberSlots << " fiber-local slots, "
                                     << handles << " handles and " << gdiObjects << " GDI objects are left";
}

TEST(ProcessCensus, CountsEveryResource) {
  const auto before = ProcessCensus::Take();
  const auto unchanged = ProcessCensus::Take();
  EXPECT_EQ(unchanged.heapBlocks, before.heapBlocks);

  void* const block = HeapAlloc(GetProcessHeap(), 0, 1000);
  const DWORD threadSlot = TlsAlloc();
  const DWORD fiberSlot = FlsAlloc(nullptr);
  const HANDLE handle = CreateEventW(nullptr, FALSE, FALSE, nullptr);
  const HDC gdiObject = CreateCompatibleDC(nullptr);
  const auto after = ProcessCensus::Take();
  DeleteDC(gdiObject);
  CloseHandle(handle);
  FlsFree(fiberSlot);
  TlsFree(threadSlot);
  HeapFree(GetProcessHeap(), 0, block);

  EXPECT_GT(after.heapBlocks, before.heapBlocks);
  EXPECT_GE(after.heapBytes, before.heapBytes + 1000);
  EXPECT_EQ(after.threadSlots, before.threadSlots + 1);
  EXPECT_EQ(after.fiberSlots, before.fiberSlots + 1);
  EXPECT_GT(after.handles, before.handles);
  EXPECT_GT(after.gdiObjects, before.gdiObjects);
}

/// Runs up to eight batches of cycles until one of them leaves nothing. Each batch runs the cycle over all
/// files, `times` times. Some batches leave something that is not the DLL's: the system's heap grows for a
/// while, and this program's own thread library makes a permanent event for each of its locks that two
/// threads happen to request at once. What the DLL leaves appears in every batch.
template <class Cycle>
AssertionResult EndsUpLeavingNothing(const std::vector<std::filesystem::path>& files, int times,
                                     const Cycle& cycle) {
  constexpr int kBatches = 8;
  AssertionResult nothingLeft = testing::AssertionFailure();
  for (int batch = 0; batch < kBatches && !nothingLeft && !testing::Test::HasFailure(); ++batch) {
    const auto before = ProcessCensus::Take();
    for (int i = 0; i < times; ++i) std::ranges::for_each(files, cycle);
    nothingLeft = NothingIsLeft(before, ProcessCensus::Take());
  }
  return nothingLeft;
}

TEST_F(Unloading, LeavesNothingAfterManyCycles) {
  const TempFolder folder;
  const auto files = WriteFiles(folder);
  int exceptions = 0;
  for (const auto& file : files) exceptions += Cycle(file);
  EXPECT_GT(exceptions, 0);  // thrown by the DLL, caught here

  // Some heaps keep small blocks in groups and show a group as one block. Wine has up to 31 blocks in a
  // group.
  constexpr int kTimes = 40;
  EXPECT_TRUE(EndsUpLeavingNothing(files, kTimes, [this](const auto& file) { Cycle(file); }));
}

TEST_F(Unloading, LeavesNothingInOtherThreads) {
  const TempFolder folder;
  const auto files = WriteFiles(folder);

  // One thread outlives the DLL, the other ends before it is unloaded.
  const HANDLE go = CreateEventW(nullptr, FALSE, FALSE, nullptr);
  const HANDLE done = CreateEventW(nullptr, FALSE, FALSE, nullptr);
  const ServerDll* dll = nullptr;
  const std::filesystem::path* file = nullptr;
  std::thread living([&] {
    for (WaitForSingleObject(go, INFINITE); dll != nullptr; WaitForSingleObject(go, INFINITE)) {
      MakeEveryRequest(*dll, *file);
      SetEvent(done);
    }
  });
  const auto cycle = [&](const std::filesystem::path& path) {
    const ServerDll loaded;
    dll = &loaded;
    file = &path;
    SignalObjectAndWait(go, done, INFINITE, FALSE);
    std::thread([&] { MakeEveryRequest(loaded, path); }).join();
    EXPECT_EQ(loaded.CanUnloadNow(), S_OK);
    dll = nullptr;
  };
  for (const auto& path : files) cycle(path);

  EXPECT_TRUE(EndsUpLeavingNothing(files, 4, cycle));

  SetEvent(go);
  living.join();
  CloseHandle(go);
  CloseHandle(done);
}

}  // namespace
}  // namespace Qel::Lumetra::ShellExt::Testing
