#include "metadata.h"

#include <shlwapi.h>

#include "string_ids.h"
#include "text.h"

namespace Qel::Lumetra::ShellExt {
namespace {

std::wstring Join(Size2 size, const wchar_t* separator) {
  return std::to_wstring(size.width) + separator + std::to_wstring(size.height);
}

/// "4096 x 4096"
std::wstring PlainDimensions(const FileTypeInfo& file) {
  return Join(file.GetDimensions(), L" x ");
}

/// "(4096 x 4096) 16 bit signed"
std::wstring TypedDimensions(const FileTypeInfo& file) {
  return L"(" + Join(file.GetDimensions(), L" x ") + L") " + file.GetDataTypeName();
}

std::wstring Comment(const FileTypeInfo& file) {
  return file.GetComment();
}

std::wstring TypeDescription(const FileTypeInfo& file) {
  return file.GetTypeDescription();
}

/// Where the views disagree about what a property says. None of it is an oversight: each way has readers of
/// its own who have learned to expect it.
struct Rules {
  std::wstring (*dimensions)(const FileTypeInfo&);
  std::wstring (*comments)(const FileTypeInfo&);
  bool sizeForResolution;
};

Rules RulesOf(View view) {
  switch (view) {
    // The form in which the shell itself writes dimensions, so that the column sorts and reads like its own.
    // The resolution is the pixel size: whoever asks for it, though no column declares it, gets a number.
    case View::kColumn: return {PlainDimensions, Comment, true};
    // The same texts, but a set has only the properties that it enumerates.
    case View::kPropertySet: return {PlainDimensions, Comment, false};
    // The property lists that are registered for the handlers have no place of their own for the pixel type
    // and the kind of file: the one stands with the dimensions, the other in place of the comment.
    case View::kPropertyStore: return {TypedDimensions, TypeDescription, false};
  }
  return {};
}

/// A text as a BSTR, a number as a signed 32-bit value of the type `numberType`.
template <class Value>
HRESULT ToAutomationValue(const Metadatum& metadatum, VARTYPE numberType, Value& value) {
  Value made{};
  if (const auto* const text = std::get_if<std::wstring>(&metadatum)) {
    made.vt = VT_BSTR;
    made.bstrVal = SysAllocString(text->c_str());
    if (made.bstrVal == nullptr) return E_OUTOFMEMORY;
  } else {
    made.vt = numberType;
    made.lVal = std::get<std::int32_t>(metadatum);
  }
  value = made;
  return S_OK;
}

}  // namespace

std::optional<Metadatum> FindMetadatum(View view, const FileTypeInfo& file, const PROPERTYKEY& key) {
  const Rules rules = RulesOf(view);
  if (key.fmtid == kSummarySet && key.pid == PIDSI_COMMENTS) return rules.comments(file);
  if (key.fmtid != kImageSummarySet) return std::nullopt;
  switch (key.pid) {
    case kHorizontalResolutionId:
      if (!rules.sizeForResolution) return std::nullopt;
      [[fallthrough]];
    case kWidthId: return file.GetDimensions().width;
    case kVerticalResolutionId:
      if (!rules.sizeForResolution) return std::nullopt;
      [[fallthrough]];
    case kHeightId: return file.GetDimensions().height;
    case kBitDepthId: return file.GetBitDepth();
    case kFrameCountId: return file.GetFrameCount();
    case kDimensionsId: return rules.dimensions(file);
    default: return std::nullopt;
  }
}

std::wstring TipDimensions(const FileTypeInfo& file) {
  const std::int32_t frames = file.GetFrameCount();
  std::wstring text;
  if (frames > 1) text = std::to_wstring(frames) + L" " + LoadResourceString(IDS_IMAGES) + L" ";
  // The tip is read by people only, hence the multiplication sign and not the letter of the properties.
  return text + L"(" + Join(file.GetDimensions(), L" \u00D7 ") + L") " + file.GetDataTypeName();
}

// The columns give the types that every automation client knows.
HRESULT ToColumnValue(const Metadatum& metadatum, VARIANT& value) {
  return ToAutomationValue(metadatum, VT_I4, value);
}

// The sets announce the type of each property in their enumerators, and for their numbers that has always
// been the machine integer.
HRESULT ToPropertySetValue(const Metadatum& metadatum, PROPVARIANT& value) {
  return ToAutomationValue(metadatum, VT_INT, value);
}

// The property system declares these properties as unsigned numbers and as strings.
HRESULT ToPropertyStoreValue(const Metadatum& metadatum, PROPVARIANT& value) {
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

}  // namespace Qel::Lumetra::ShellExt
