#include "columns.h"

#include <algorithm>
#include <fstream>
#include <iterator>
#include <memory>
#include <optional>
#include <string>

#include "file_type_factory.h"
#include "path_stream.h"
#include "property_table.h"
#include "text.h"

namespace Qel::Lumetra::ShellExt {
namespace {

/// Returns the key of the property that a column shows. The two resolution keys, which no column declares,
/// map to the size in pixels: clients that request them expect a number.
PROPERTYKEY ShownKey(const SHCOLUMNID& column) {
  constexpr PROPID kHorizontalResolutionId = 5;
  constexpr PROPID kVerticalResolutionId = 6;
  PROPERTYKEY key = column;
  if (key.fmtid == kImageSummarySet && key.pid == kHorizontalResolutionId) key.pid = kWidthId;
  if (key.fmtid == kImageSummarySet && key.pid == kVerticalResolutionId) key.pid = kHeightId;
  return key;
}

std::wstring PathOf(const SHCOLUMNDATA& item) {
  return {std::begin(item.wszFile), std::ranges::find(item.wszFile, L'\0')};
}

/// Reads the property of `column` from a file. Returns nothing for a key without a property, and for a file
/// without a valid reader.
std::optional<Metadatum> ReadFromFile(const std::wstring& path, const SHCOLUMNID& column) {
  std::ifstream stream;
  OpenPath(stream, path.c_str());
  const std::unique_ptr<FileTypeInfo> reader = CreateFileTypeInfo(stream, GetExtension(path));
  const Property* const property = FindProperty(ShownKey(column));
  if (reader == nullptr || !reader->IsValid() || property == nullptr) return std::nullopt;
  return property->value(*reader);
}

}  // namespace

HRESULT DescribeColumn(DWORD index, SHCOLUMNINFO* info) {
  if (index >= kProperties.size()) return S_FALSE;
  if (info == nullptr) return E_POINTER;
  const Property& property = kProperties[index];
  const std::wstring title = LoadResourceString(property.title);
  *info = {};
  info->scid = property.key;
  info->vt = property.declaredType;
  info->fmt = LVCFMT_LEFT;
  info->cChars = property.width;
  info->csFlags = property.state;
  title.copy(info->wszTitle, std::size(info->wszTitle) - 1);
  return S_OK;
}

HRESULT ReadColumn(const SHCOLUMNID& column, const SHCOLUMNDATA* item, VARIANT* value) {
  if (column.fmtid != kImageSummarySet && column.fmtid != kSummarySet) return S_FALSE;
  if (item == nullptr) return E_POINTER;
  const std::optional<Metadatum> found = ReadFromFile(PathOf(*item), column);
  if (!found) return S_FALSE;
  if (value == nullptr) return E_POINTER;
  VARIANT made{};
  // VT_I4 is the number type that every automation client knows.
  HRESULT result = ToAutomationValue(*found, VT_I4, made);
  if (SUCCEEDED(result)) result = VariantClear(value);
  if (SUCCEEDED(result)) {
    *value = made;
  } else {
    VariantClear(&made);
  }
  return result;
}

}  // namespace Qel::Lumetra::ShellExt
