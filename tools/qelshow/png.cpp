#include "png.h"

#include <wincodec.h>

#include "com_ptr.h"

namespace Qel::Lumetra::ShellExt::Show {
namespace {

using Com::ComPtr;

using namespace std::string_view_literals;

constexpr std::string_view kSignature = "\x89PNG\r\n\x1A\n"sv;

/// A text chunk with its length and checksum, and its position after the signature and the header chunk.
constexpr std::string_view kMark = "\0\0\0\x10tEXtSoftware\0qelshow\xE8\xA0\x60\x39"sv;
constexpr std::size_t kMarkPosition = 33;
static_assert(kMarkPosition + kMark.size() == kMarkedPngBytes);

HRESULT WriteFrame(IWICBitmapFrameEncode& frame, const BITMAP& bitmap) {
  HRESULT result = frame.Initialize(nullptr);
  if (SUCCEEDED(result)) {
    result = frame.SetSize(static_cast<UINT>(bitmap.bmWidth), static_cast<UINT>(bitmap.bmHeight));
  }
  const WICPixelFormatGUID wanted =
      bitmap.bmBitsPixel == 8 ? GUID_WICPixelFormat8bppGray : GUID_WICPixelFormat24bppBGR;
  WICPixelFormatGUID format = wanted;
  if (SUCCEEDED(result)) result = frame.SetPixelFormat(&format);
  if (SUCCEEDED(result) && format != wanted) result = WINCODEC_ERR_UNSUPPORTEDPIXELFORMAT;
  if (SUCCEEDED(result)) {
    const auto rowBytes = static_cast<UINT>(bitmap.bmWidthBytes);
    const auto height = static_cast<UINT>(bitmap.bmHeight);
    result = frame.WritePixels(height, rowBytes, rowBytes * height, static_cast<BYTE*>(bitmap.bmBits));
  }
  return SUCCEEDED(result) ? frame.Commit() : result;
}

HRESULT WritePng(IStream& stream, const BITMAP& bitmap) {
  ComPtr<IWICImagingFactory> factory;
  HRESULT result = CoCreateInstance(CLSID_WICImagingFactory, nullptr, CLSCTX_INPROC_SERVER,
                                    IID_IWICImagingFactory, reinterpret_cast<void**>(factory.Put()));
  ComPtr<IWICBitmapEncoder> encoder;
  if (SUCCEEDED(result)) {
    result = factory->CreateEncoder(GUID_ContainerFormatPng, nullptr, encoder.Put());
  }
  if (SUCCEEDED(result)) result = encoder->Initialize(&stream, WICBitmapEncoderNoCache);
  ComPtr<IWICBitmapFrameEncode> frame;
  if (SUCCEEDED(result)) result = encoder->CreateNewFrame(frame.Put(), nullptr);
  if (SUCCEEDED(result)) result = WriteFrame(*frame.Get(), bitmap);
  return SUCCEEDED(result) ? encoder->Commit() : result;
}

HRESULT ReadAll(IStream& stream, std::vector<std::uint8_t>& bytes) {
  STATSTG status{};
  HRESULT result = stream.Stat(&status, STATFLAG_NONAME);
  if (SUCCEEDED(result)) result = stream.Seek({}, STREAM_SEEK_SET, nullptr);
  if (FAILED(result)) return result;
  bytes.resize(static_cast<std::size_t>(status.cbSize.QuadPart));
  ULONG read = 0;
  result = stream.Read(bytes.data(), static_cast<ULONG>(bytes.size()), &read);
  if (SUCCEEDED(result) && read != bytes.size()) result = STG_E_READFAULT;
  if (FAILED(result)) bytes.clear();
  return result;
}

}  // namespace

HRESULT EncodePng(HBITMAP bitmap, std::vector<std::uint8_t>& png) {
  png.clear();
  DIBSECTION section{};
  if (GetObjectW(bitmap, sizeof section, &section) != static_cast<int>(sizeof section)) return E_INVALIDARG;
  if (section.dsBm.bmBitsPixel != 8 && section.dsBm.bmBitsPixel != 24) return E_INVALIDARG;
  ComPtr<IStream> stream;
  HRESULT result = CreateStreamOnHGlobal(nullptr, TRUE, stream.Put());
  if (SUCCEEDED(result)) result = WritePng(*stream.Get(), section.dsBm);
  if (SUCCEEDED(result)) result = ReadAll(*stream.Get(), png);
  if (SUCCEEDED(result)) png.insert(png.begin() + kMarkPosition, kMark.begin(), kMark.end());
  return result;
}

bool IsMarkedPng(std::string_view beginning) {
  return beginning.size() >= kMarkedPngBytes && beginning.starts_with(kSignature) &&
         beginning.substr(kMarkPosition).starts_with(kMark);
}

}  // namespace Qel::Lumetra::ShellExt::Show
