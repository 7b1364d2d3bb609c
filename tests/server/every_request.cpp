#include "every_request.h"

#include <windows.h>

#include <propsys.h>
#include <shlobj.h>
#include <shlwapi.h>

#include <algorithm>
#include <array>
#include <exception>
#include <string>

namespace Qel::Lumetra::ShellExt::Testing {
namespace {

/// As many of anything as the server could possibly enumerate.
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

void ReadProperties(IPropertyStorage& storage) {
  ComPtr<IEnumSTATPROPSTG> properties;
  storage.Enum(properties.Put());
  if (!properties) return;
  ComPtr<IEnumSTATPROPSTG> copy;
  properties->Clone(copy.Put());
  std::array<STATPROPSTG, kMany> stats{};
  ULONG count = 0;
  properties->Next(kMany, stats.data(), &count);
  properties->Skip(1);
  properties->Reset();
  for (ULONG i = 0; i < count; ++i) {
    PROPSPEC id{};
    id.ulKind = PRSPEC_PROPID;
    id.propid = stats[i].propid;
    PROPVARIANT value{};
    storage.ReadMultiple(1, &id, &value);
    PropVariantClear(&value);
  }
  STATPROPSETSTG stat{};
  storage.Stat(&stat);
  storage.Commit(0);
}

void AskForPropertySets(IPropertySetStorage& storage) {
  ComPtr<IEnumSTATPROPSETSTG> sets;
  storage.Enum(sets.Put());
  if (!sets) return;
  std::array<STATPROPSETSTG, kMany> stats{};
  ULONG count = 0;
  sets->Next(kMany, stats.data(), &count);
  for (ULONG i = 0; i < count; ++i) {
    ComPtr<IPropertyStorage> set;
    storage.Open(stats[i].fmtid, STGM_READ, set.Put());
    if (set) ReadProperties(*set.Get());
    storage.Delete(stats[i].fmtid);
  }
}

void AskForProperties(IPropertyStore& store) {
  DWORD count = 0;
  store.GetCount(&count);
  for (DWORD i = 0; i < kMany; ++i) {
    PROPERTYKEY key{};
    store.GetAt(i, &key);
    PROPVARIANT value{};
    store.GetValue(key, &value);
    store.SetValue(key, value);
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
  const auto object = dll.CreateInstance<IUnknown>(kShellExtClass, IID_IUnknown);
  for (int load = 0; load < 2; ++load) {
    exceptions +=
        CountExceptions([&] { As<IPersistFile>(object, IID_IPersistFile)->Load(path.c_str(), STGM_READ); });
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
    AskForProperties(*As<IPropertyStore>(outer.inner, IID_IPropertyStore).Get());
  }
  return exceptions;
}

}  // namespace Qel::Lumetra::ShellExt::Testing
