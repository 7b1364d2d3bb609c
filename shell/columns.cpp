#include "columns.h"

#include <algorithm>
#include <array>
#include <cstdint>
#include <cwchar>
#include <fstream>
#include <iterator>
#include <memory>
#include <optional>
#include <string>

#include "file_type_factory.h"
#include "metadata.h"
#include "path_stream.h"
#include "string_ids.h"
#include "text.h"

namespace Qel::Lumetra::ShellExt {
namespace {

/// How a column presents itself. Numbers sort as texts and the declared types are not those of the values
/// (metadata.cpp): that is how the shell knows these columns, and it is to stay.
struct Column {
  VARTYPE declaredType;
  UINT width;  // in characters
  DWORD state;
  std::uint32_t title;
};

constexpr DWORD kText = SHCOLSTATE_TYPE_STR;
constexpr DWORD kHiddenText = SHCOLSTATE_TYPE_STR | SHCOLSTATE_HIDDEN;
constexpr DWORD kShownText = SHCOLSTATE_TYPE_STR | SHCOLSTATE_ONBYDEFAULT;

/// In the order of kListedProperties.
constexpr std::array<Column, kListedProperties.size()> kColumns{{
    {VT_I4, 5, kHiddenText, IDS_WIDTH},
    {VT_I4, 5, kHiddenText, IDS_HEIGHT},
    {VT_UI4, 5, kText, IDS_BIT_DEPTH},
    {VT_UI4, 5, kText, IDS_FRAME_COUNT},
    {VT_LPWSTR, 20, kShownText, IDS_DIMENSIONS},
    {VT_LPWSTR, 30, kShownText, IDS_COMMENTS},
}};

std::wstring PathOf(const SHCOLUMNDATA& item) {
  return {std::begin(item.wszFile), std::find(std::begin(item.wszFile), std::end(item.wszFile), L'\0')};
}

std::optional<Metadatum> FindInFile(const std::wstring& path, const PROPERTYKEY& key) {
  std::ifstream stream;
  OpenPath(stream, path.c_str());
  const std::unique_ptr<FileTypeInfo> file = CreateFileTypeInfo(stream, GetExtension(path));
  if (file == nullptr || !file->IsValid()) return std::nullopt;
  return FindMetadatum(View::kColumn, *file, key);
}

}  // namespace

HRESULT DescribeColumn(DWORD index, SHCOLUMNINFO* info) {
  if (index >= kColumns.size()) return S_FALSE;
  if (info == nullptr) return E_POINTER;
  const Column& column = kColumns[index];
  const std::wstring title = LoadResourceString(column.title);
  *info = {};
  info->scid = kListedProperties[index];
  info->vt = column.declaredType;
  info->fmt = LVCFMT_LEFT;
  info->cChars = column.width;
  info->csFlags = column.state;
  title.copy(info->wszTitle, std::size(info->wszTitle) - 1);
  return S_OK;
}

HRESULT ReadColumn(const SHCOLUMNID& column, const SHCOLUMNDATA* item, VARIANT* value) {
  if (column.fmtid != kImageSummarySet && column.fmtid != kSummarySet) return S_FALSE;
  if (item == nullptr) return E_POINTER;
  const std::optional<Metadatum> found = FindInFile(PathOf(*item), column);
  if (!found) return S_FALSE;
  if (value == nullptr) return E_POINTER;
  if (const HRESULT result = VariantClear(value); FAILED(result)) return result;
  return ToColumnValue(*found, *value);
}

}  // namespace Qel::Lumetra::ShellExt
