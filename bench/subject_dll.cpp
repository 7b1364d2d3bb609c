// Implements subject.h with the built DLL, used as the shell uses it.
#include <windows.h>

#include <propsys.h>
#include <shlobj.h>
#include <shlwapi.h>

#include <algorithm>
#include <filesystem>
#include <iterator>
#include <map>
#include <vector>

#include "com_ptr.h"
#include "property_table.h"
#include "server_dll.h"
#include "subject.h"

namespace Qel::Lumetra::ShellExt::Bench {
namespace {

using Com::ComPtr;
using Testing::kMrcHandlerClass;
using Testing::kRawHandlerClass;
using Testing::kShellExtClass;

template <class Interface>
ComPtr<Interface> Create(const CLSID& clsid, const IID& iid) {
  static const Testing::ServerDll server;
  return server.CreateInstance<Interface>(clsid, iid);
}

/// Returns a new object that has loaded the file.
template <class Interface>
ComPtr<Interface> Load(const std::wstring& path, const IID& iid) {
  const auto file = Create<IPersistFile>(kShellExtClass, IID_IPersistFile);
  file->Load(path.c_str(), STGM_READ);
  ComPtr<Interface> object;
  file->QueryInterface(iid, reinterpret_cast<void**>(object.Put()));
  return object;
}

bool ReadTip(const std::wstring& path) {
  wchar_t* tip = nullptr;
  if (Load<IQueryInfo>(path, IID_IQueryInfo)->GetInfoTip(0, &tip) != S_OK) return false;
  CoTaskMemFree(tip);
  return true;
}

/// Reads all columns of the Details view.
bool ReadColumns(const std::wstring& path) {
  const auto provider = Create<IColumnProvider>(kShellExtClass, IID_IColumnProvider);
  SHCOLUMNDATA file{};
  path.copy(file.wszFile, std::size(file.wszFile) - 1);
  return std::ranges::all_of(kProperties, [&](const Property& property) {
    VARIANT value;
    VariantInit(&value);
    const HRESULT result = provider->GetItemData(&property.key, &file, &value);
    VariantClear(&value);
    return result == S_OK;
  });
}

/// Reads all properties of both property sets.
bool ReadPropertySets(const std::wstring& path) {
  const auto sets = Load<IPropertySetStorage>(path, IID_IPropertySetStorage);
  return std::ranges::all_of(kProperties, [&](const Property& property) {
    ComPtr<IPropertyStorage> storage;
    if (sets->Open(property.key.fmtid, STGM_READ, storage.Put()) != S_OK) return false;
    PROPSPEC specifier{};
    specifier.ulKind = PRSPEC_PROPID;
    specifier.propid = property.key.pid;
    PROPVARIANT value;
    PropVariantInit(&value);
    const HRESULT result = storage->ReadMultiple(1, &specifier, &value);
    PropVariantClear(&value);
    return result == S_OK;
  });
}

/// Reads all properties of the property store, from a stream.
bool ReadPropertyStore(const std::wstring& path) {
  const bool isRaw = std::filesystem::path(path).extension() == L".raw";
  const auto handler =
      Create<IInitializeWithStream>(isRaw ? kRawHandlerClass : kMrcHandlerClass, IID_IInitializeWithStream);
  ComPtr<IStream> stream;
  if (SHCreateStreamOnFileEx(path.c_str(), STGM_READ | STGM_SHARE_DENY_NONE, FILE_ATTRIBUTE_NORMAL, FALSE,
                             nullptr, stream.Put()) != S_OK) {
    return false;
  }
  handler->Initialize(stream.Get(), STGM_READ);
  ComPtr<IPropertyStore> store;
  handler->QueryInterface(IID_IPropertyStore, reinterpret_cast<void**>(store.Put()));
  return std::ranges::all_of(kProperties, [&](const Property& property) {
    PROPVARIANT value;
    PropVariantInit(&value);
    const HRESULT result = store->GetValue(property.key, &value);
    PropVariantClear(&value);
    return result == S_OK;
  });
}

}  // namespace

HBITMAP MakeThumbnail(const std::wstring& path, const SIZE& request) {
  const auto extractor = Load<IExtractImage>(path, IID_IExtractImage);
  wchar_t location[MAX_PATH] = {};
  DWORD priority = 0;
  DWORD flags = 0;
  extractor->GetLocation(location, MAX_PATH, &priority, &request, 24, &flags);
  HBITMAP bitmap = nullptr;
  extractor->Extract(&bitmap);
  return bitmap;
}

bool ReadMetadata(const std::string& view, const std::wstring& path) {
  static const std::map<std::string, bool (*)(const std::wstring&)> kViews = {
      {"tip", ReadTip}, {"columns", ReadColumns}, {"sets", ReadPropertySets}, {"store", ReadPropertyStore}};
  return kViews.at(view)(path);
}

bool ReadBlocks(const std::wstring& path, const Blocks& blocks) {
  const HANDLE file = CreateFileW(path.c_str(), GENERIC_READ, FILE_SHARE_READ, nullptr, OPEN_EXISTING,
                                  FILE_ATTRIBUTE_NORMAL, nullptr);
  if (file == INVALID_HANDLE_VALUE) return false;
  std::vector<char> bytes(blocks.bytes);
  bool done = true;
  for (std::int64_t i = 0; i < blocks.count && done; ++i) {
    // Seeks and reads in two calls, because Wine passes a read with a position to its server, which takes
    // twenty times as long.
    LARGE_INTEGER position{};
    position.QuadPart = blocks.first + i * blocks.distance;
    DWORD read = 0;
    done = SetFilePointerEx(file, position, nullptr, FILE_BEGIN) &&
           ReadFile(file, bytes.data(), static_cast<DWORD>(bytes.size()), &read, nullptr) &&
           read == bytes.size();
  }
  CloseHandle(file);
  return done;
}

}  // namespace Qel::Lumetra::ShellExt::Bench
