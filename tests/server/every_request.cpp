#include "every_request.h"

#include <windows.h>

#include <propsys.h>
#include <shlobj.h>
#include <shlwapi.h>

#include <algorithm>
#include <array>
#include <exception>
#include <string>
#include <vector>

namespace Qel::Lumetra::ShellExt::Testing {
namespace {

/// More than any enumerator of the server lists.
constexpr DWORD kMany = 8;

void AskForThumbnail(IExtractImage& image) {
  const SIZE size{8, 8};
  std::array<wchar_t, MAX_PATH> path{};
  DWORD priority = 0;
  DWORD flags = IEIFLAG_ASYNC;
  image.GetLocation(path.data(), MAX_PATH, &priority, &size, 24, &flags);
  for (int i = 0; i < 2; ++i) {
    HBITMAP bitmap = nullptr;
    image.Extract(&bitmap);
    if (bitmap != nullptr) DeleteObject(bitmap);
  }
}

void AskForItself(IPersistFile& file, const std::filesystem::path& path) {
  CLSID clsid{};
  file.GetClassID(&clsid);
  file.IsDirty();
  file.Save(path.c_str(), FALSE);
  file.SaveCompleted(path.c_str());
  wchar_t* current = nullptr;
  file.GetCurFile(&current);
}

void AskForInfoTip(IQueryInfo& info) {
  wchar_t* tip = nullptr;
  info.GetInfoTip(QITIPF_DEFAULT, &tip);
  CoTaskMemFree(tip);
  DWORD flags = 0;
  info.GetInfoFlags(&flags);
}

void AskForColumns(IColumnProvider& columns, const std::filesystem::path& path) {
  const SHCOLUMNINIT init{};
  columns.Initialize(&init);
  SHCOLUMNDATA file{};
  const std::wstring name = path.wstring();
  std::copy_n(name.c_str(), std::min<std::size_t>(name.size(), MAX_PATH - 1), file.wszFile);
  for (DWORD i = 0; i < kMany; ++i) {
    SHCOLUMNINFO column{};
    columns.GetColumnInfo(i, &column);
    VARIANT value{};
    columns.GetItemData(&column.scid, &file, &value);
    VariantClear(&value);
  }
}

/// Reads an enumerator and a copy of it to the end. Returns what the enumerator lists.
template <class Stat, class Enumerator>
std::vector<Stat> List(Enumerator& enumerator) {
  ComPtr<Enumerator> copy;
  enumerator.Clone(copy.Put());
  std::vector<Stat> stats(kMany);
  ULONG count = 0;
  if (copy) copy->Next(kMany, stats.data(), &count);
  enumerator.Skip(1);
  enumerator.Reset();
  enumerator.Next(kMany, stats.data(), &count);
  stats.resize(count);
  return stats;
}

void ChangeProperty(IPropertyStorage& storage, const PROPSPEC& id) {
  const PROPVARIANT value{};
  storage.WriteMultiple(1, &id, &value, PID_FIRST_USABLE);
  storage.DeleteMultiple(1, &id);
  wchar_t text[] = L"name";
  wchar_t* name = nullptr;
  storage.ReadPropertyNames(1, &id.propid, &name);
  CoTaskMemFree(name);
  name = text;
  storage.WritePropertyNames(1, &id.propid, &name);
  storage.DeletePropertyNames(1, &id.propid);
}

void ReadProperties(IPropertyStorage& storage) {
  ComPtr<IEnumSTATPROPSTG> properties;
  storage.Enum(properties.Put());
  if (!properties) return;
  for (const STATPROPSTG& stat : List<STATPROPSTG>(*properties.Get())) {
    PROPSPEC id{};
    id.ulKind = PRSPEC_PROPID;
    id.propid = stat.propid;
    PROPVARIANT value{};
    storage.ReadMultiple(1, &id, &value);
    PropVariantClear(&value);
    ChangeProperty(storage, id);
  }
  STATPROPSETSTG stat{};
  storage.Stat(&stat);
  storage.SetTimes(nullptr, nullptr, nullptr);
  storage.SetClass(CLSID_NULL);
  storage.Commit(0);
  storage.Revert();
}

void AskForPropertySets(IPropertySetStorage& storage) {
  ComPtr<IEnumSTATPROPSETSTG> sets;
  storage.Enum(sets.Put());
  if (!sets) return;
  for (const STATPROPSETSTG& stat : List<STATPROPSETSTG>(*sets.Get())) {
    ComPtr<IPropertyStorage> set;
    storage.Open(stat.fmtid, STGM_READ, set.Put());
    if (set) ReadProperties(*set.Get());
    ComPtr<IPropertyStorage> made;
    storage.Create(stat.fmtid, nullptr, 0, STGM_READWRITE, made.Put());
    storage.Delete(stat.fmtid);
  }
}

void AskForProperties(IPropertyStore& store, IPropertyStoreCapabilities& capabilities) {
  DWORD count = 0;
  store.GetCount(&count);
  for (DWORD i = 0; i < kMany; ++i) {
    PROPERTYKEY key{};
    store.GetAt(i, &key);
    PROPVARIANT value{};
    store.GetValue(key, &value);
    store.SetValue(key, value);
    capabilities.IsPropertyWritable(key);
    PropVariantClear(&value);
  }
  store.Commit();
}

template <class Requests>
int CountExceptions(Requests requests) {
  try {
    requests();
  } catch (const std::exception&) {
    return 1;
  }
  return 0;
}

}  // namespace

int MakeEveryRequest(const ServerDll& dll, const std::filesystem::path& path) {
  int exceptions = 0;
  const ComPtr<IClassFactory> factory = dll.Factory(kShellExtClass);
  factory->LockServer(TRUE);
  factory->LockServer(FALSE);
  const auto object = dll.CreateInstance<IUnknown>(kShellExtClass, IID_IUnknown);
  for (int load = 0; load < 2; ++load) {
    exceptions +=
        CountExceptions([&] { As<IPersistFile>(object, IID_IPersistFile)->Load(path.c_str(), STGM_READ); });
    AskForItself(*As<IPersistFile>(object, IID_IPersistFile).Get(), path);
    AskForThumbnail(*As<IExtractImage>(object, IID_IExtractImage).Get());
    AskForInfoTip(*As<IQueryInfo>(object, IID_IQueryInfo).Get());
    AskForPropertySets(*As<IPropertySetStorage>(object, IID_IPropertySetStorage).Get());
  }
  exceptions +=
      CountExceptions([&] { AskForColumns(*As<IColumnProvider>(object, IID_IColumnProvider).Get(), path); });

  for (const CLSID& handler : {kEbnHandlerClass, kRawHandlerClass, kMrcHandlerClass}) {
    ComPtr<IStream> stream;
    SHCreateStreamOnFileEx(path.c_str(), STGM_READ | STGM_SHARE_DENY_NONE, 0, FALSE, nullptr, stream.Put());
    OuterObject outer;
    outer.inner = dll.CreateInstance<IUnknown>(handler, IID_IUnknown, &outer);
    exceptions += CountExceptions([&] {
      As<IInitializeWithStream>(outer.inner, IID_IInitializeWithStream)->Initialize(stream.Get(), STGM_READ);
    });
    AskForProperties(*As<IPropertyStore>(outer.inner, IID_IPropertyStore).Get(),
                     *As<IPropertyStoreCapabilities>(outer.inner, IID_IPropertyStoreCapabilities).Get());
  }
  return exceptions;
}

}  // namespace Qel::Lumetra::ShellExt::Testing
