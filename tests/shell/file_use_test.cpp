// Counts how often the DLL opens a file and how much it reads, for requests that need no picture.
#include <gtest/gtest.h>
#include <io.h>
#include <windows.h>

#include <shlobj.h>

#include <filesystem>
#include <string>
#include <vector>

#include "ebn_file.h"
#include "import_patch.h"
#include "mrc_file.h"
#include "raw_file.h"
#include "server_dll.h"
#include "shell_values.h"
#include "temp_folder.h"

namespace Qel::Lumetra::ShellExt::Testing {
namespace {

struct FileUse {
  int opens = 0;
  int reads = 0;
  int bytes = 0;
};

FileUse g_use;

HANDLE WINAPI CountedOpen(LPCWSTR path, DWORD access, DWORD share, LPSECURITY_ATTRIBUTES security,
                          DWORD disposition, DWORD attributes, HANDLE pattern) {
  ++g_use.opens;
  return CreateFileW(path, access, share, security, disposition, attributes, pattern);
}

int CountedRead(int file, void* bytes, unsigned int count) {
  const int read = _read(file, bytes, count);
  ++g_use.reads;
  g_use.bytes += read;
  return read;
}

class FileUseTest : public ServerTest {
 protected:
  /// Returns files with many more bytes of pixels than of header.
  std::vector<std::filesystem::path> Files() const {
    const std::string pixels(64 * 1024, 'p');
    return {folder_.Write(L"a.mrc", MrcFile{.nx = 256, .ny = 256, .mode = 0, .pixels = pixels}.Bytes()),
            folder_.Write(L"a.raw", PackedRawFile(DataType::kUInt8, 256, 256, pixels).Bytes()),
            folder_.Write(L"a.ebn", EbnFile{.width = 256, .height = 256, .afterHeader = pixels}.Bytes())};
  }

  /// Expects that `work` opens one file and fills the stream's buffer once.
  template <class Work>
  static void ExpectOneHeaderRead(const Work& work) {
    g_use = {};
    work();
    EXPECT_EQ(g_use.opens, 1);
    EXPECT_EQ(g_use.reads, 1);
    EXPECT_LE(g_use.bytes, 2048);
  }

  TempFolder folder_;
  ImportPatch open_{dll_.module(), "CreateFileW", &CountedOpen};
  ImportPatch read_{dll_.module(), "_read", &CountedRead};
};

TEST_F(FileUseTest, TipAndPropertySetsReadTheHeaderOnce) {
  for (const auto& file : Files()) {
    SCOPED_TRACE(file.extension());
    const auto object = dll_.CreateInstance<IPersistFile>(kShellExtClass, IID_IPersistFile);
    ExpectOneHeaderRead([&] {
      EXPECT_EQ(object->Load(file.c_str(), STGM_READ), S_OK);
      wchar_t* tip = nullptr;
      EXPECT_EQ(As<IQueryInfo>(object, IID_IQueryInfo)->GetInfoTip(QITIPF_DEFAULT, &tip), S_OK);
      CoTaskMemFree(tip);
      const auto sets = As<IPropertySetStorage>(object, IID_IPropertySetStorage);
      for (const PROPERTYKEY& key : kAllKeys) {
        ComPtr<IPropertyStorage> storage;
        EXPECT_EQ(sets->Open(key.fmtid, STGM_READ, storage.Put()), S_OK);
        PROPSPEC property{};
        property.ulKind = PRSPEC_PROPID;
        property.propid = key.pid;
        PROPVARIANT value{};
        EXPECT_EQ(storage->ReadMultiple(1, &property, &value), S_OK);
        PropVariantClear(&value);
      }
    });
  }
}

TEST_F(FileUseTest, EveryColumnReadsTheHeaderOnce) {
  const auto provider = dll_.CreateInstance<IColumnProvider>(kShellExtClass, IID_IColumnProvider);
  for (const auto& file : Files()) {
    SCOPED_TRACE(file.extension());
    SHCOLUMNDATA item{};
    file.native().copy(item.wszFile, std::size(item.wszFile) - 1);
    for (const PROPERTYKEY& key : kAllKeys) {
      SCOPED_TRACE(key.pid);
      ExpectOneHeaderRead([&] {
        VARIANT value{};
        EXPECT_EQ(provider->GetItemData(&key, &item, &value), S_OK);
        VariantClear(&value);
      });
    }
  }
}

}  // namespace
}  // namespace Qel::Lumetra::ShellExt::Testing
