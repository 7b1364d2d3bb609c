#include "shell_view.h"

#include <propsys.h>
#include <shlobj.h>
#include <shlwapi.h>
#include <wincodec.h>

#include <algorithm>
#include <cstdlib>
#include <vector>

#include "shell_obstacles.h"
#include "shell_requests.h"
#include "text_tools.h"
#include "value_text.h"

namespace Qel::Lumetra::ShellExt::Show {
namespace {

using Com::ComPtr;

/// The shell's result for a thumbnail that it is still making.
constexpr auto kExtractionPending = static_cast<HRESULT>(0x8004B205);

/// Rows of pixels from the top. A pixel has four bytes: blue, green, red and an unused one.
struct Pixels {
  std::int32_t width = 0;
  std::int32_t height = 0;
  std::vector<std::uint8_t> bytes;

  void Resize() { bytes.resize(static_cast<std::size_t>(width) * static_cast<std::size_t>(height) * 4); }
};

template <class Interface, class Object>
HRESULT QueryFor(const ComPtr<Object>& object, const IID& iid, ComPtr<Interface>& answer) {
  return object->QueryInterface(iid, reinterpret_cast<void**>(answer.Put()));
}

/// Returns the pixels of a bitmap; an empty result on failure.
Pixels PixelsOf(HBITMAP bitmap) {
  BITMAP facts{};
  if (GetObjectW(bitmap, sizeof facts, &facts) == 0) return {};
  Pixels pixels;
  pixels.width = facts.bmWidth;
  pixels.height = std::abs(facts.bmHeight);
  pixels.Resize();
  BITMAPINFO info{};
  info.bmiHeader.biSize = sizeof info.bmiHeader;
  info.bmiHeader.biWidth = pixels.width;
  info.bmiHeader.biHeight = -pixels.height;
  info.bmiHeader.biPlanes = 1;
  info.bmiHeader.biBitCount = 32;
  info.bmiHeader.biCompression = BI_RGB;
  const HDC dc = CreateCompatibleDC(nullptr);
  const int rows =
      GetDIBits(dc, bitmap, 0, static_cast<UINT>(pixels.height), pixels.bytes.data(), &info, DIB_RGB_COLORS);
  DeleteDC(dc);
  return rows == pixels.height ? pixels : Pixels();
}

/// Returns the pixels of a PNG file; an empty result on failure, and if `png` is empty.
Pixels PixelsOf(const std::vector<std::uint8_t>& png) {
  ComPtr<IStream> stream;
  *stream.Put() = SHCreateMemStream(png.data(), static_cast<UINT>(png.size()));
  ComPtr<IWICImagingFactory> factory;
  HRESULT result = CoCreateInstance(CLSID_WICImagingFactory, nullptr, CLSCTX_INPROC_SERVER,
                                    IID_IWICImagingFactory, reinterpret_cast<void**>(factory.Put()));
  ComPtr<IWICBitmapDecoder> decoder;
  if (SUCCEEDED(result)) {
    result = factory->CreateDecoderFromStream(stream.Get(), nullptr, WICDecodeMetadataCacheOnDemand,
                                              decoder.Put());
  }
  ComPtr<IWICBitmapFrameDecode> frame;
  if (SUCCEEDED(result)) result = decoder->GetFrame(0, frame.Put());
  ComPtr<IWICBitmapSource> converted;
  if (SUCCEEDED(result)) {
    result = WICConvertBitmapSource(GUID_WICPixelFormat32bppBGR, frame.Get(), converted.Put());
  }
  UINT width = 0;
  UINT height = 0;
  if (SUCCEEDED(result)) result = converted->GetSize(&width, &height);
  if (FAILED(result)) return {};
  Pixels pixels;
  pixels.width = static_cast<std::int32_t>(width);
  pixels.height = static_cast<std::int32_t>(height);
  pixels.Resize();
  result =
      converted->CopyPixels(nullptr, width * 4, static_cast<UINT>(pixels.bytes.size()), pixels.bytes.data());
  return SUCCEEDED(result) ? pixels : Pixels();
}

/// Returns the largest difference, in levels of a colour channel, between two images of the same size.
int LargestDifference(const Pixels& a, const Pixels& b) {
  int largest = 0;
  for (std::size_t i = 0; i < a.bytes.size(); ++i) {
    if (i % 4 != 3) largest = std::max(largest, std::abs(a.bytes[i] - b.bytes[i]));
  }
  return largest;
}

std::wstring Shape(const Pixels& pixels) {
  return std::to_wstring(pixels.width) + L" x " + std::to_wstring(pixels.height) + L" pixels";
}

/// Returns whether `shown` has the size of `own` reduced to the request. Each side may be rounded.
bool IsReducedFrom(const Pixels& own, const Pixels& shown, std::int32_t size) {
  const std::int32_t longer = std::max(own.width, own.height);
  const auto isReduced = [&](std::int32_t ownSide, std::int32_t shownSide) {
    return std::abs(std::int64_t{ownSide} * size - std::int64_t{shownSide} * longer) <= longer;
  };
  return isReduced(own.width, shown.width) && isReduced(own.height, shown.height);
}

ShellAnswer Compare(const Pixels& own, const Pixels& shown, std::int32_t size) {
  if (own.bytes.empty()) return {Agreement::kDiffers, Shape(shown) + L"; QelShellExt returns none"};
  if (std::max(own.width, own.height) > size && IsReducedFrom(own, shown, size)) {
    return {Agreement::kReduced, {}};
  }
  if (own.width != shown.width || own.height != shown.height) {
    return {Agreement::kDiffers, Shape(shown) + L" instead of " + Shape(own)};
  }
  const int difference = LargestDifference(own, shown);
  if (difference == 0) return {Agreement::kSame, {}};
  return {Agreement::kDiffers, L"pixel values differ by up to " + std::to_wstring(difference) + L" of 255"};
}

/// Returns whether this is Wine, whose shell returns the same image of one pixel for every file.
bool IsWine() {
  return GetProcAddress(GetModuleHandleW(L"ntdll.dll"), "wine_get_version") != nullptr;
}

/// Gets the thumbnail that the shell has or makes, never an icon instead. Returns the shell's result.
HRESULT GetThumbnail(IShellItemImageFactory& factory, std::int32_t size, HBITMAP& bitmap) {
  constexpr int kMaxTries = 100;
  HRESULT result = E_PENDING;
  for (int i = 0; i < kMaxTries && (result == E_PENDING || result == kExtractionPending); ++i) {
    if (i > 0) Sleep(100);
    result = factory.GetImage({size, size}, SIIGBF_THUMBNAILONLY, &bitmap);
  }
  return result;
}

ShellAnswer CompareThumbnails(const ComPtr<IShellItem2>& item, const ThumbnailAnswer& own) {
  const std::int32_t size = own.thumbnail.request;
  ComPtr<IShellItemImageFactory> factory;
  HRESULT result = QueryFor(item, IID_IShellItemImageFactory, factory);
  HBITMAP bitmap = nullptr;
  if (SUCCEEDED(result)) result = GetThumbnail(*factory.Get(), size, bitmap);
  if (result == E_NOINTERFACE || result == E_NOTIMPL) return {};
  if (FAILED(result)) {
    return own.png.empty() ? ShellAnswer{Agreement::kSame, {}}
                           : ShellAnswer{Agreement::kNothing, ResultText(result)};
  }
  const Pixels shown = PixelsOf(bitmap);
  DeleteObject(bitmap);
  return Compare(PixelsOf(own.png), shown, size);
}

ShellAnswer CompareProperties(const ComPtr<IShellItem2>& item, const ListAnswer<Property>& own) {
  ComPtr<IPropertyStore> store;
  const HRESULT result =
      item->GetPropertyStore(GPS_DEFAULT, IID_IPropertyStore, reinterpret_cast<void**>(store.Put()));
  if (result == E_NOTIMPL) return {};
  if (own.items.empty()) return {Agreement::kSame, {}};
  if (FAILED(result)) return {Agreement::kNothing, ResultText(result)};
  bool hasAny = false;
  std::wstring differences;
  for (const Property& property : own.items) {
    PROPERTYKEY key{{}, property.id};
    CLSIDFromString(property.set.c_str(), &key.fmtid);
    PROPVARIANT value{};
    store->GetValue(key, &value);
    const std::wstring text = ValueText(ValueOf(value));
    const std::wstring ownText = ValueText(property.value);
    PropVariantClear(&value);
    hasAny = hasAny || !text.empty();
    if (text == ownText) continue;
    if (!differences.empty()) differences += L", ";
    differences.append(property.name).append(L" is \"").append(text);
    differences.append(L"\" instead of \"").append(ownText).append(L"\"");
  }
  if (differences.empty()) return {Agreement::kSame, {}};
  return hasAny ? ShellAnswer{Agreement::kDiffers, differences}
                : ShellAnswer{Agreement::kNothing, L"all values are empty"};
}

/// Returns what the shell shows, as the end of a sentence after "Windows". `another` is the phrase
/// for something different, such as "another thumbnail".
std::wstring Phrase(const ShellAnswer& answer, const std::wstring& what, const std::wstring& another) {
  switch (answer.agreement) {
    case Agreement::kSame: return L"shows the " + what + L" of QelShellExt";
    case Agreement::kReduced: return L"shows the " + what + L" of QelShellExt (reduced further)";
    case Agreement::kDiffers: return L"shows " + another + L" (" + answer.detail + L")";
    case Agreement::kNothing: return L"shows no " + what + L" (" + answer.detail + L")";
    case Agreement::kUnanswered: break;
  }
  return L"does not report the " + what;
}

bool IsAsExpected(const ShellAnswer& answer) {
  return answer.agreement != Agreement::kDiffers && answer.agreement != Agreement::kNothing;
}

}  // namespace

ShellView RequestShellView(const ExtensionClient& client, const std::wstring& path, std::int32_t size) {
  if (IsWine()) return {};
  // The extension is asked first. If it crashes, the shell is not asked.
  const ThumbnailAnswer thumbnail = RequestThumbnail(client, path, size);
  const ListAnswer<Property> properties = RequestPropertyStore(client, path);
  ComPtr<IShellItem2> item;
  const HRESULT result = SHCreateItemFromParsingName(path.c_str(), nullptr, IID_IShellItem2,
                                                     reinterpret_cast<void**>(item.Put()));
  if (result == E_NOINTERFACE || result == E_NOTIMPL) return {};
  if (FAILED(result)) {
    const ShellAnswer nothing{Agreement::kNothing, ResultText(result)};
    return {nothing, nothing};
  }
  return CompareWithShell(item, thumbnail, properties);
}

ShellView CompareWithShell(const ComPtr<IShellItem2>& item, const ThumbnailAnswer& thumbnail,
                           const ListAnswer<Property>& properties) {
  return {CompareThumbnails(item, thumbnail), CompareProperties(item, properties)};
}

bool IsAsExpected(const ShellView& view) {
  return IsAsExpected(view.thumbnail) && IsAsExpected(view.properties);
}

std::wstring ShellText(const ShellView& view, const std::wstring& path) {
  if (view.thumbnail.agreement == Agreement::kUnanswered &&
      view.properties.agreement == Agreement::kUnanswered) {
    return L"This system does not report what it shows for a file, which is normal under Wine.";
  }
  if (view.thumbnail.agreement == Agreement::kSame && view.properties.agreement == Agreement::kSame)
    return L"Windows shows the thumbnail and the properties of QelShellExt.";
  std::wstring text = L"Windows " + Phrase(view.thumbnail, L"thumbnail", L"another thumbnail") + L" and " +
                      Phrase(view.properties, L"properties", L"other properties") + L".";
  if (view.thumbnail.agreement == Agreement::kNothing) return text + L" " + CauseOfNoThumbnail(path);
  if (!IsAsExpected(view.thumbnail)) return text + L" " + CauseOfAnotherThumbnail();
  if (!IsAsExpected(view.properties)) return text + L" " + CauseOfOtherProperties();
  return text;
}

}  // namespace Qel::Lumetra::ShellExt::Show
