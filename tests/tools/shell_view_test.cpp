// Tests the comparison of what the shell shows with what the extension returns. A fake shell gives the
// answers.
#include "shell_view.h"

#include <gtest/gtest.h>
#include <windows.h>

#include <propsys.h>
#include <propvarutil.h>

#include <cstdint>
#include <functional>
#include <optional>
#include <string>
#include <utility>
#include <vector>

#include "dib_section.h"
#include "handle_owner.h"
#include "png.h"
#include "shell_values.h"
#include "text_tools.h"

namespace Qel::Lumetra::ShellExt::Show {
namespace {

using Com::ComPtr;

constexpr std::int32_t kRequest = 20;

/// Makes a bitmap as the shell does: 32 bits per pixel, bottom-up.
HBITMAP ShellBitmap(std::int32_t width, std::int32_t height,
                    const std::function<std::uint8_t(std::int32_t, std::int32_t)>& level) {
  BITMAPINFO info{};
  info.bmiHeader.biSize = sizeof info.bmiHeader;
  info.bmiHeader.biWidth = width;
  info.bmiHeader.biHeight = height;
  info.bmiHeader.biPlanes = 1;
  info.bmiHeader.biBitCount = 32;
  void* bits = nullptr;
  const HBITMAP bitmap = CreateDIBSection(nullptr, &info, DIB_RGB_COLORS, &bits, nullptr, 0);
  auto* pixel = static_cast<std::uint32_t*>(bits);
  for (std::int32_t y = height - 1; y >= 0; --y) {
    for (std::int32_t x = 0; x < width; ++x) *pixel++ = 0xFF000000u + 0x10101u * level(x, y);
  }
  return bitmap;
}

std::uint8_t Level(std::int32_t x, std::int32_t y) {
  return static_cast<std::uint8_t>(x * 10 + y);
}

/// A file in a shell, which gives these answers.
class FakeItem final : public IShellItem2, public IShellItemImageFactory {
 public:
  std::vector<HRESULT> failures;  // the results of the first requests for a thumbnail
  std::function<HBITMAP()> thumbnail;
  HRESULT storeResult = S_OK;
  ComPtr<IPropertyStore> store;
  bool hasThumbnails = true;
  SIIGBF flags{};

  HRESULT STDMETHODCALLTYPE QueryInterface(REFIID iid, void** object) override {
    *object = nullptr;
    if (iid == IID_IShellItemImageFactory && hasThumbnails)
      *object = static_cast<IShellItemImageFactory*>(this);
    return *object != nullptr ? S_OK : E_NOINTERFACE;
  }
  ULONG STDMETHODCALLTYPE AddRef() override { return 2; }
  ULONG STDMETHODCALLTYPE Release() override { return 1; }

  HRESULT STDMETHODCALLTYPE GetImage(SIZE size, SIIGBF wanted, HBITMAP* bitmap) override {
    EXPECT_EQ(size.cx, kRequest);
    EXPECT_EQ(size.cy, kRequest);
    flags = wanted;
    if (!failures.empty()) {
      const HRESULT failure = failures.front();
      failures.erase(failures.begin());
      return failure;
    }
    *bitmap = thumbnail();
    return S_OK;
  }

  HRESULT STDMETHODCALLTYPE GetPropertyStore(GETPROPERTYSTOREFLAGS, REFIID iid, void** object) override {
    return storeResult == S_OK ? store->QueryInterface(iid, object) : storeResult;
  }

  HRESULT STDMETHODCALLTYPE BindToHandler(IBindCtx*, REFGUID, REFIID, void**) override { return E_NOTIMPL; }
  HRESULT STDMETHODCALLTYPE GetParent(IShellItem**) override { return E_NOTIMPL; }
  HRESULT STDMETHODCALLTYPE GetDisplayName(SIGDN, LPWSTR*) override { return E_NOTIMPL; }
  HRESULT STDMETHODCALLTYPE GetAttributes(SFGAOF, SFGAOF*) override { return E_NOTIMPL; }
  HRESULT STDMETHODCALLTYPE Compare(IShellItem*, SICHINTF, int*) override { return E_NOTIMPL; }
  HRESULT STDMETHODCALLTYPE GetPropertyStoreWithCreateObject(GETPROPERTYSTOREFLAGS, IUnknown*, REFIID,
                                                             void**) override {
    return E_NOTIMPL;
  }
  HRESULT STDMETHODCALLTYPE GetPropertyStoreForKeys(const PROPERTYKEY*, UINT, GETPROPERTYSTOREFLAGS, REFIID,
                                                    void**) override {
    return E_NOTIMPL;
  }
  HRESULT STDMETHODCALLTYPE GetPropertyDescriptionList(REFPROPERTYKEY, REFIID, void**) override {
    return E_NOTIMPL;
  }
  HRESULT STDMETHODCALLTYPE Update(IBindCtx*) override { return E_NOTIMPL; }
  HRESULT STDMETHODCALLTYPE GetProperty(REFPROPERTYKEY, PROPVARIANT*) override { return E_NOTIMPL; }
  HRESULT STDMETHODCALLTYPE GetCLSID(REFPROPERTYKEY, CLSID*) override { return E_NOTIMPL; }
  HRESULT STDMETHODCALLTYPE GetFileTime(REFPROPERTYKEY, FILETIME*) override { return E_NOTIMPL; }
  HRESULT STDMETHODCALLTYPE GetInt32(REFPROPERTYKEY, int*) override { return E_NOTIMPL; }
  HRESULT STDMETHODCALLTYPE GetString(REFPROPERTYKEY, LPWSTR*) override { return E_NOTIMPL; }
  HRESULT STDMETHODCALLTYPE GetUInt32(REFPROPERTYKEY, ULONG*) override { return E_NOTIMPL; }
  HRESULT STDMETHODCALLTYPE GetUInt64(REFPROPERTYKEY, ULONGLONG*) override { return E_NOTIMPL; }
  HRESULT STDMETHODCALLTYPE GetBool(REFPROPERTYKEY, WINBOOL*) override { return E_NOTIMPL; }
};

class ShellComparison : public testing::Test {
 protected:
  ShellComparison() {
    CoInitializeEx(nullptr, COINIT_APARTMENTTHREADED);
    SetOwnThumbnail(12, 8);
    own_.thumbnail.request = kRequest;
    properties_.items.resize(2);
    properties_.items[0] = {
        L"System.Image.HorizontalSize", GuidText(Testing::kImageSummary), 3, {}, L"640", {}};
    properties_.items[1] = {L"System.Comment", GuidText(Testing::kSummary), 6, {}, L"", {}};
    EXPECT_EQ(PSCreateMemoryPropertyStore(IID_IPropertyStore, reinterpret_cast<void**>(item_.store.Put())),
              S_OK);
    SetShellWidth(640);
    item_.thumbnail = [] { return ShellBitmap(12, 8, Level); };
  }
  ~ShellComparison() override {
    item_.store = {};
    CoUninitialize();
  }

  void SetOwnThumbnail(std::int32_t width, std::int32_t height) {
    DibSection section;
    section.CreateGrey(width, height);
    for (std::int32_t y = 0; y < height; ++y) {
      for (std::int32_t x = 0; x < width; ++x) section.Bits().Store(x, y, Level(x, y));
    }
    const Com::OwnedBitmap bitmap(section.Release());
    EXPECT_EQ(EncodePng(bitmap.Get(), own_.png), S_OK);
  }

  void SetShellWidth(std::optional<ULONG> width) const {
    PROPVARIANT value{};
    if (width) InitPropVariantFromUInt32(*width, &value);
    EXPECT_EQ(item_.store->SetValue(Testing::kWidthKey, value), S_OK);
  }

  ShellView View() { return CompareWithShell(ComPtr<IShellItem2>(&item_), own_, properties_); }
  ShellAnswer Thumbnail() { return View().thumbnail; }
  ShellAnswer Properties() { return View().properties; }

  FakeItem item_;
  ThumbnailAnswer own_;
  ListAnswer<Property> properties_;
};

TEST_F(ShellComparison, AgreesIfEveryPixelAndValueIsTheSame) {
  const ShellView view = View();
  EXPECT_EQ(view.thumbnail.agreement, Agreement::kSame);
  EXPECT_EQ(view.properties.agreement, Agreement::kSame);
  EXPECT_TRUE(IsAsExpected(view));
  EXPECT_EQ(item_.flags, SIIGBF_THUMBNAILONLY);
  EXPECT_EQ(ShellText(view, L"a.mrc"), L"Windows shows the thumbnail and the properties of QelShellExt.");
}

TEST_F(ShellComparison, ReportsByHowMuchASinglePixelDiffers) {
  item_.thumbnail = [] {
    return ShellBitmap(12, 8, [](std::int32_t x, std::int32_t y) {
      return static_cast<std::uint8_t>(Level(x, y) + (x == 11 && y == 0 ? 3 : 0));
    });
  };
  EXPECT_EQ(Thumbnail().agreement, Agreement::kDiffers);
  EXPECT_EQ(Thumbnail().detail, L"pixel values differ by up to 3 of 255");
  EXPECT_FALSE(IsAsExpected(View()));
}

TEST_F(ShellComparison, ReportsADifferentSize) {
  item_.thumbnail = [] { return ShellBitmap(8, 12, Level); };
  EXPECT_EQ(Thumbnail().agreement, Agreement::kDiffers);
  EXPECT_EQ(Thumbnail().detail, L"8 x 12 pixels instead of 12 x 8 pixels");
  const std::wstring text = ShellText(View(), L"a.mrc");
  EXPECT_TRUE(
      text.starts_with(L"Windows shows another thumbnail (8 x 12 pixels instead of 12 x 8 pixels) and "
                       L"shows the properties of QelShellExt. The likely cause is an older thumbnail"))
      << Utf8(text);
}

TEST_F(ShellComparison, ComparesTheProportionsOfAReducedThumbnail) {
  SetOwnThumbnail(39, 25);
  item_.thumbnail = [] { return ShellBitmap(20, 13, Level); };
  EXPECT_EQ(Thumbnail().agreement, Agreement::kReduced);
  EXPECT_TRUE(IsAsExpected(View()));
  EXPECT_EQ(ShellText(View(), L"a.mrc"),
            L"Windows shows the thumbnail of QelShellExt (reduced further) and shows the properties of "
            L"QelShellExt.");
  for (const auto& [width, height] : {std::pair{20, 20}, std::pair{20, 11}, std::pair{18, 13}}) {
    item_.thumbnail = [width, height] { return ShellBitmap(width, height, Level); };
    EXPECT_EQ(Thumbnail().agreement, Agreement::kDiffers) << width;
  }
}

TEST_F(ShellComparison, ExpectsNoThumbnailIfTheExtensionHasNone) {
  own_.png.clear();
  EXPECT_EQ(Thumbnail().agreement, Agreement::kDiffers);
  item_.failures = {E_FAIL};
  EXPECT_EQ(Thumbnail().agreement, Agreement::kSame);
}

TEST_F(ShellComparison, WaitsForAThumbnailThatIsBeingMade) {
  item_.failures = {E_PENDING, static_cast<HRESULT>(0x8004B205)};
  EXPECT_EQ(Thumbnail().agreement, Agreement::kSame);
}

TEST_F(ShellComparison, ReportsAMissingThumbnailWithALikelyCause) {
  item_.failures = {static_cast<HRESULT>(0x8004B200)};
  const ShellView view = View();
  EXPECT_EQ(view.thumbnail.agreement, Agreement::kNothing);
  EXPECT_FALSE(IsAsExpected(view));
  const std::wstring text = ShellText(view, L"a.mrc");
  EXPECT_TRUE(text.starts_with(L"Windows shows no thumbnail (0x8004B200")) << Utf8(text);
  EXPECT_NE(
      text.find(L" and shows the properties of QelShellExt. The likely cause is that QelShellExt does not "
                L"work in the isolated process"),
      std::wstring::npos)
      << Utf8(text);
}

TEST_F(ShellComparison, ReportsWhichPropertyDiffers) {
  SetShellWidth(64);
  properties_.items[1].value = std::wstring(L"comment");
  const ShellAnswer answer = Properties();
  EXPECT_EQ(answer.agreement, Agreement::kDiffers);
  EXPECT_EQ(answer.detail,
            L"System.Image.HorizontalSize is \"64\" instead of \"640\", System.Comment is \"\" instead of "
            L"\"comment\"");
  const std::wstring text = ShellText(View(), L"a.mrc");
  EXPECT_TRUE(
      text.starts_with(L"Windows shows the thumbnail of QelShellExt and shows other properties (System."))
      << Utf8(text);
  EXPECT_TRUE(
      text.ends_with(L"The likely cause is that Windows has not noticed the installation yet, or another "
                     L"program's property handler: sign out and in again, and see \"Another program\" in the "
                     L"user guide."))
      << Utf8(text);
  SetShellWidth(std::nullopt);
  EXPECT_EQ(Properties().agreement, Agreement::kNothing);
  item_.storeResult = E_ACCESSDENIED;
  EXPECT_EQ(Properties().agreement, Agreement::kNothing);
}

TEST_F(ShellComparison, ComparesNoPropertiesForAKindWithoutAStore) {
  properties_.items.clear();
  EXPECT_EQ(Properties().agreement, Agreement::kSame);
}

TEST_F(ShellComparison, RecognisesAShellThatDoesNotAnswer) {
  item_.hasThumbnails = false;
  item_.storeResult = E_NOTIMPL;
  const ShellView view = View();
  EXPECT_EQ(view.thumbnail.agreement, Agreement::kUnanswered);
  EXPECT_EQ(view.properties.agreement, Agreement::kUnanswered);
  EXPECT_TRUE(IsAsExpected(view));
  EXPECT_EQ(ShellText(view, L"a.mrc"),
            L"This system does not report what it shows for a file, which is normal under Wine.");
}

}  // namespace
}  // namespace Qel::Lumetra::ShellExt::Show
