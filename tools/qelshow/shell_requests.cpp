#include "shell_requests.h"

#include <propidl.h>
#include <propsys.h>
#include <shlguid.h>
#include <shlobj.h>
#include <shlwapi.h>

#include <algorithm>
#include <exception>
#include <string_view>

#include "class_ids.h"
#include "file_type_factory.h"
#include "handle_owner.h"
#include "png.h"
#include "property_table.h"
#include "same_text.h"
#include "text_tools.h"
#include "value_text.h"

namespace Qel::Lumetra::ShellExt::Show {
namespace {

/// The most items of a list, in case the extension never reports its end.
constexpr DWORD kMaxItems = 64;

/// Owns a PROPVARIANT or VARIANT, and clears it.
template <class Variant, auto kInit, auto kClear>
struct OwnedVariant : Variant {
  OwnedVariant() { kInit(this); }
  ~OwnedVariant() { kClear(this); }
  OwnedVariant(const OwnedVariant&) = delete;
  OwnedVariant& operator=(const OwnedVariant&) = delete;
};

using PropertyValue = OwnedVariant<PROPVARIANT, &PropVariantInit, &PropVariantClear>;
using ColumnValue = OwnedVariant<VARIANT, &VariantInit, &VariantClear>;

std::wstring NoAnswer(const wchar_t* what, HRESULT result) {
  return std::wstring(L"The extension returned no ") + what + L": " + ResultText(result) + L".";
}

/// Runs `request`. The text of an exception that leaves the extension becomes the problem.
template <class Request>
void Guard(std::wstring& problem, Request request) {
  try {
    request();
  } catch (const std::exception& e) {
    problem = L"The extension threw an exception: " + Wide(e.what()) + L".";
  } catch (...) {
    problem = L"The extension threw an exception of an unknown type.";
  }
}

template <class Object, class Interface>
HRESULT QueryFor(const ComPtr<Object>& object, ComPtr<Interface>& answer) {
  return object->QueryInterface(Com::kInterfaceId<Interface>, reinterpret_cast<void**>(answer.Put()));
}

/// Creates a new object and passes it the path, as the shell does. Returns the first failure.
template <class Interface>
HRESULT LoadFile(const ExtensionClient& client, const std::wstring& path, ComPtr<Interface>& object) {
  ComPtr<IPersistFile> file;
  HRESULT result = client.Create(CLSID_QelShellExt, file);
  if (SUCCEEDED(result)) result = file->Load(path.c_str(), STGM_READ);
  if (SUCCEEDED(result)) {
    result = QueryFor(file, object);
  }
  return result;
}

/// Fills the value of a column, or the reason why there is none.
void FillValue(IColumnProvider& provider, const SHCOLUMNID& id, const SHCOLUMNDATA& file, Column& column) {
  ColumnValue value;
  const HRESULT result = provider.GetItemData(&id, &file, &value);
  if (result == S_OK) {
    column.returned = TypeName(value.vt);
    column.value = ValueOf(value);
  } else {
    column.problem = ResultText(result);
  }
}

HRESULT ReadPropertySet(IPropertySetStorage& sets, const GUID& format, std::vector<Property>& properties) {
  ComPtr<IPropertyStorage> storage;
  HRESULT result = sets.Open(format, STGM_READ | STGM_SHARE_EXCLUSIVE, storage.Put());
  ComPtr<IEnumSTATPROPSTG> enumerator;
  if (SUCCEEDED(result)) result = storage->Enum(enumerator.Put());
  if (FAILED(result)) return result;
  STATPROPSTG entry{};
  ULONG fetched = 0;
  while (enumerator->Next(1, &entry, &fetched) == S_OK && fetched == 1) {
    CoTaskMemFree(entry.lpwstrName);
    Property property;
    const ShellExt::Property* const known = FindProperty({format, entry.propid});
    property.name = known == nullptr ? L"" : known->plainName;
    property.set = GuidText(format);
    property.id = entry.propid;
    PROPSPEC specifier{};
    specifier.ulKind = PRSPEC_PROPID;
    specifier.propid = entry.propid;
    PropertyValue value;
    const HRESULT read = storage->ReadMultiple(1, &specifier, &value);
    if (read == S_OK) {
      property.type = TypeName(value.vt);
      property.value = ValueOf(value);
    } else {
      property.problem = ResultText(read);
    }
    properties.push_back(std::move(property));
  }
  return S_OK;
}

}  // namespace

const CLSID* StoreClassOf(const std::wstring& path) {
  const std::wstring extension = GetExtension(path);
  if (IsEbnExtension(extension)) return &CLSID_QelShellExtVistaEbn;
  if (IsRawExtension(extension)) return &CLSID_QelShellExtVistaRaw;
  // .ali and .rec have the format of .mrc, but no class is registered for them with the property system.
  return SameIgnoringCase(extension, L"mrc") ? &CLSID_QelShellExtVistaMrc : nullptr;
}

TipAnswer RequestTip(const ExtensionClient& client, const std::wstring& path) {
  TipAnswer answer;
  Guard(answer.problem, [&] {
    ComPtr<IQueryInfo> info;
    HRESULT result = LoadFile(client, path, info);
    wchar_t* text = nullptr;
    if (SUCCEEDED(result)) result = info->GetInfoTip(0, &text);
    if (result == S_OK && text != nullptr) {
      answer.text = text;
    } else {
      answer.problem = NoAnswer(L"tip", result);
    }
    CoTaskMemFree(text);
  });
  return answer;
}

ListAnswer<Column> RequestColumns(const ExtensionClient& client, const std::wstring& path) {
  ListAnswer<Column> answer;
  Guard(answer.problem, [&] {
    ComPtr<IColumnProvider> provider;
    HRESULT result = client.Create(CLSID_QelShellExt, provider);
    const SHCOLUMNINIT folder{};
    if (SUCCEEDED(result)) result = provider->Initialize(&folder);
    if (FAILED(result)) {
      answer.problem = NoAnswer(L"columns", result);
      return;
    }
    SHCOLUMNDATA file{};
    if (path.size() >= std::size(file.wszFile)) {
      answer.problem = L"Windows requests no columns for paths of 260 characters or more.";
      return;
    }
    std::ranges::copy(path, file.wszFile);
    std::wstring extension = L"." + GetExtension(path);
    file.pwszExt = extension.data();
    file.dwFileAttributes = FILE_ATTRIBUTE_NORMAL;

    SHCOLUMNINFO info{};
    for (DWORD index = 0; index < kMaxItems; ++index) {
      result = provider->GetColumnInfo(index, &info);
      if (result != S_OK) break;
      Column column;
      column.index = index;
      column.title = info.wszTitle;
      column.set = GuidText(info.scid.fmtid);
      column.id = info.scid.pid;
      column.characters = info.cChars;
      column.state = info.csFlags;
      column.declared = TypeName(info.vt);
      FillValue(*provider.Get(), info.scid, file, column);
      answer.items.push_back(std::move(column));
    }
    if (answer.items.empty()) answer.problem = NoAnswer(L"columns", result);
  });
  return answer;
}

ListAnswer<Property> RequestPropertySets(const ExtensionClient& client, const std::wstring& path) {
  ListAnswer<Property> answer;
  Guard(answer.problem, [&] {
    ComPtr<IPropertySetStorage> sets;
    HRESULT result = LoadFile(client, path, sets);
    ComPtr<IEnumSTATPROPSETSTG> enumerator;
    if (SUCCEEDED(result)) result = sets->Enum(enumerator.Put());
    STATPROPSETSTG entry{};
    ULONG fetched = 0;
    while (SUCCEEDED(result) && enumerator->Next(1, &entry, &fetched) == S_OK && fetched == 1) {
      result = ReadPropertySet(*sets.Get(), entry.fmtid, answer.items);
    }
    if (FAILED(result)) answer.problem = NoAnswer(L"property sets", result);
  });
  return answer;
}

ListAnswer<Property> RequestPropertyStore(const ExtensionClient& client, const std::wstring& path) {
  ListAnswer<Property> answer;
  Guard(answer.problem, [&] {
    const CLSID* const clsid = StoreClassOf(path);
    if (clsid == nullptr) {
      answer.problem = L"QelShellExt has no property store for ." + Lowered(GetExtension(path)) +
                       L" files, only for .mrc, .ebn and .raw files.";
      return;
    }
    ComPtr<IInitializeWithStream> handler;
    HRESULT result = client.Create(*clsid, handler);
    ComPtr<IStream> stream;
    if (SUCCEEDED(result)) {
      result = SHCreateStreamOnFileEx(path.c_str(), STGM_READ | STGM_SHARE_DENY_NONE, FILE_ATTRIBUTE_NORMAL,
                                      FALSE, nullptr, stream.Put());
    }
    if (SUCCEEDED(result)) result = handler->Initialize(stream.Get(), STGM_READ);
    ComPtr<IPropertyStore> store;
    if (SUCCEEDED(result)) {
      result = QueryFor(handler, store);
    }
    if (FAILED(result)) {
      answer.problem = NoAnswer(L"property store", result);
      return;
    }
    // GetCount returns 0 by design, so the keys are requested until there are no more.
    PROPERTYKEY key{};
    for (DWORD index = 0; index < kMaxItems && store->GetAt(index, &key) == S_OK; ++index) {
      Property property;
      const ShellExt::Property* const known = FindProperty(key);
      property.name = known == nullptr ? L"" : known->canonicalName;
      property.set = GuidText(key.fmtid);
      property.id = key.pid;
      PropertyValue value;
      result = store->GetValue(key, &value);
      if (SUCCEEDED(result)) {
        property.type = TypeName(value.vt);
        property.value = ValueOf(value);
      } else {
        property.problem = ResultText(result);
      }
      answer.items.push_back(std::move(property));
    }
    if (answer.items.empty()) answer.problem = NoAnswer(L"property store", result);
  });
  return answer;
}

ThumbnailAnswer RequestThumbnail(const ExtensionClient& client, const std::wstring& path, std::int32_t size) {
  ThumbnailAnswer answer;
  Thumbnail& thumbnail = answer.thumbnail;
  thumbnail.request = size;
  Guard(thumbnail.problem, [&] {
    ComPtr<IExtractImage> extractor;
    HRESULT result = LoadFile(client, path, extractor);
    if (SUCCEEDED(result)) {
      wchar_t location[MAX_PATH] = L"";
      DWORD priority = 0;
      DWORD flags = IEIFLAG_SCREEN;
      const SIZE request = {size, size};
      result = extractor->GetLocation(location, MAX_PATH, &priority, &request, 32, &flags);
    }
    Com::OwnedBitmap bitmap;
    if (SUCCEEDED(result)) result = extractor->Extract(bitmap.Put());
    BITMAP facts{};
    if (FAILED(result) || GetObjectW(bitmap.Get(), sizeof facts, &facts) == 0) {
      thumbnail.problem = NoAnswer(L"thumbnail", result);
      return;
    }
    result = EncodePng(bitmap.Get(), answer.png);
    if (FAILED(result)) {
      thumbnail.problem = L"The thumbnail cannot be encoded as PNG: " + ResultText(result) + L".";
      return;
    }
    thumbnail.width = facts.bmWidth;
    thumbnail.height = facts.bmHeight;
    thumbnail.bitsPerPixel = facts.bmBitsPixel;
  });
  return answer;
}

std::wstring RequestObject(const std::wstring& clsid) {
  CLSID id{};
  HRESULT result = CLSIDFromString(clsid.c_str(), &id);
  ComPtr<IUnknown> object;
  if (SUCCEEDED(result)) {
    result = CoCreateInstance(id, nullptr, CLSCTX_INPROC_SERVER, IID_IUnknown,
                              reinterpret_cast<void**>(object.Put()));
  }
  if (SUCCEEDED(result)) return {};
  return L"An object of the class " + clsid + L" cannot be created: " + ResultText(result) + L".";
}

}  // namespace Qel::Lumetra::ShellExt::Show
