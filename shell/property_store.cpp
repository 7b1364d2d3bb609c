#include "property_store.h"

#include <shlwapi.h>

#include <cstddef>
#include <cstring>
#include <mutex>

#include "image_file_info.h"
#include "property_table.h"

namespace Qel::Lumetra::ShellExt {
namespace {

// Room for the put-back reserve of the buffer and for the largest header, that of an MRC file. So one Read
// gets the whole header of every kind that has a property store. From an MRC file it gets nothing else.
constexpr std::size_t kBufferBytes = 4 + 1024;

constexpr HRESULT kNoCount = 6;

/// Makes a value of the type that the property system declares for the property: VT_UI4, or VT_LPWSTR from
/// the task allocator. Returns the failure of SHStrDupW; `value` is written on success only.
HRESULT ToStoreValue(const Metadatum& metadatum, PROPVARIANT& value) {
  PROPVARIANT made{};
  if (const auto* const text = std::get_if<std::wstring>(&metadatum)) {
    made.vt = VT_LPWSTR;
    if (const HRESULT result = SHStrDupW(text->c_str(), &made.pwszVal); FAILED(result)) return result;
  } else {
    made.vt = VT_UI4;
    made.ulVal = static_cast<ULONG>(std::get<std::int32_t>(metadatum));
  }
  value = made;
  return S_OK;
}

}  // namespace

HRESULT CShellExtVista::Initialize(IStream* stream, DWORD mode) {
  const std::lock_guard guard(section());
  mode_ = mode;
  stream_.rdbuf()->Allocate(kBufferBytes);
  stream_.rdbuf()->Attach(stream);
  reader_ = CreateFileInfo(stream_);
  return S_OK;
}

HRESULT CShellExtVista::GetCount(DWORD* count) {
  if (count == nullptr) return E_POINTER;
  *count = 0;
  return kNoCount;
}

HRESULT CShellExtVista::GetAt(DWORD index, PROPERTYKEY* key) {
  if (key == nullptr) return E_POINTER;
  const bool isListed = index < kProperties.size();
  *key = isListed ? kProperties[index].key : PROPERTYKEY{};
  return isListed ? S_OK : E_UNEXPECTED;
}

HRESULT CShellExtVista::GetValue(REFPROPERTYKEY key, PROPVARIANT* value) {
  const std::lock_guard guard(section());
  if (reader_ == nullptr || !reader_->IsValid()) return E_FAIL;
  if (value == nullptr) return E_POINTER;
  std::memset(value, 0, sizeof *value);
  const Property* const property = FindProperty(key);
  return property != nullptr ? ToStoreValue(property->storeValue(*reader_), *value) : E_UNEXPECTED;
}

HRESULT CShellExtVista::Commit() {
  const std::lock_guard guard(section());
  stream_.rdbuf()->pubsync();
  stream_.rdbuf()->Attach(nullptr);
  return E_FAIL;
}

std::unique_ptr<FileTypeInfo> CShellExtVistaMrc::CreateFileInfo(basic_comstream<char>& stream) {
  return std::make_unique<MrcFileInfo>(stream, L"mrc");
}

std::unique_ptr<FileTypeInfo> CShellExtVistaEbn::CreateFileInfo(basic_comstream<char>& stream) {
  return std::make_unique<EbnFileInfo>(stream);
}

std::unique_ptr<FileTypeInfo> CShellExtVistaRaw::CreateFileInfo(basic_comstream<char>& stream) {
  return std::make_unique<RawFileInfo>(stream);
}

}  // namespace Qel::Lumetra::ShellExt
