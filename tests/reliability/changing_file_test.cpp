// Tests files that change while the release DLL reads them: before every single read another program appends
// to the file, truncates it, overwrites it, deletes it or makes it unreadable. The object must return a
// thumbnail or a failure and stay usable, and a new object must show the file as it is then.
#include <gtest/gtest.h>
#include <io.h>
#include <windows.h>

#include <shlobj.h>

#include <cerrno>
#include <filesystem>
#include <fstream>
#include <functional>
#include <string>

#include "bitmap_pixels.h"
#include "import_patch.h"
#include "mrc_file.h"
#include "server_dll.h"
#include "shell_values.h"
#include "temp_folder.h"
#include "unused_file.h"

namespace Qel::Lumetra::ShellExt::Testing {
namespace {

/// What another program does before the DLL's read with the index g_interruptedRead, counted from 0.
std::function<void()> g_interrupt;
int g_interruptedRead = -1;
bool g_readFails = false;
int g_reads = 0;

int InterruptedRead(int file, void* bytes, unsigned int count) {
  if (g_reads++ == g_interruptedRead) {
    if (g_interrupt) g_interrupt();
    if (g_readFails) {
      errno = EACCES;
      return -1;
    }
  }
  return _read(file, bytes, count);
}

/// Returns a file whose frame takes several reads.
std::string FrameBytes(char pixel = 'p') {
  MrcFile file;
  file.nx = 700;
  file.ny = 600;
  file.mode = 1;
  file.labels = {"a label"};
  file.pixels.assign(std::size_t{700} * 600 * 2, pixel);
  for (std::size_t i = 0; i < file.pixels.size(); i += 999) file.pixels[i] = static_cast<char>(i / 999);
  return file.Bytes();
}

class ChangingFile : public ServerTest {
 protected:
  struct Answers {
    HRESULT extract = E_FAIL;
    BitmapPixels picture;
  };

  /// Returns the answers of an object that loads the file and extracts its thumbnail, with `interrupt` called
  /// before the read `number`. Sends the other requests afterwards.
  Answers Ask(int number = -1, std::function<void()> interrupt = {}, bool readFails = false) {
    g_reads = 0;
    g_interruptedRead = number;
    g_interrupt = std::move(interrupt);
    g_readFails = readFails;
    const auto object = dll_.CreateInstance<IExtractImage>(kShellExtClass, IID_IExtractImage);
    EXPECT_EQ(As<IPersistFile>(object, IID_IPersistFile)->Load(path_.c_str(), STGM_READ), S_OK);
    Answers answers = Extract(object);
    reads_ = g_reads;
    g_interruptedRead = -1;

    // The object is still usable, whatever has happened to its file.
    const Answers again = Extract(object);
    if (answers.extract == E_FAIL) {
      EXPECT_EQ(again.extract, E_FAIL);
    }
    wchar_t* tip = nullptr;
    const HRESULT tipResult = As<IQueryInfo>(object, IID_IQueryInfo)->GetInfoTip(QITIPF_DEFAULT, &tip);
    EXPECT_EQ(tipResult, again.extract);
    CoTaskMemFree(tip);
    EXPECT_EQ(References(object), 0u);
    return answers;
  }

  static Answers Extract(const ComPtr<IExtractImage>& object) {
    HBITMAP bitmap = nullptr;
    const HRESULT result = object->Extract(&bitmap);
    EXPECT_TRUE(result == S_OK || (result == E_FAIL && bitmap == nullptr));
    return {result, TakeBitmap(bitmap)};
  }

  void Write(const std::string& bytes) {
    std::ofstream(path_, std::ios_base::binary | std::ios_base::trunc) << bytes;
  }

  /// Calls `interrupt` before every read, one read at a time, and passes the answers to `check`. The file is
  /// intact at first; afterwards nobody may have it open.
  template <class Check>
  void InterruptEveryRead(const std::function<void()>& interrupt, bool readFails, const Check& check) {
    Write(whole_);
    Ask();
    const int reads = reads_;
    ASSERT_GT(reads, 4);
    for (int number = 0; number < reads; ++number) {
      SCOPED_TRACE("read " + std::to_string(number));
      Write(whole_);
      check(Ask(number, interrupt, readFails));
      Write(whole_);
      EXPECT_TRUE(IsUnused(path_));
      EXPECT_EQ(dll_.LockCount(), 0);
    }
    EXPECT_EQ(Ask().picture, picture_);
  }

  static void ExpectAThumbnailOrNone(const Answers& answers) {
    EXPECT_EQ(answers.picture == BitmapPixels(), answers.extract != S_OK);
  }

  const ImportPatch reading_{dll_.module(), "_read", &InterruptedRead};
  const TempFolder folder_;
  const std::string whole_ = FrameBytes();
  const std::filesystem::path path_ = folder_.Write("frame.mrc", whole_);
  int reads_ = 0;
  const BitmapPixels picture_ = Ask().picture;
};

TEST_F(ChangingFile, ShowsTheSameWhenItGrows) {
  InterruptEveryRead([&] { std::ofstream(path_, std::ios_base::binary | std::ios_base::app) << whole_; },
                     false, [&](const Answers& answers) { EXPECT_EQ(answers.picture, picture_); });
}

TEST_F(ChangingFile, ShowsTheSameWhenItIsDeleted) {
  InterruptEveryRead([&] { EXPECT_TRUE(std::filesystem::remove(path_)); }, false,
                     [&](const Answers& answers) { EXPECT_EQ(answers.picture, picture_); });
}

TEST_F(ChangingFile, IsRefusedWhenItIsTruncatedUnlessItWasReadBefore) {
  for (const std::size_t length :
       {std::size_t{0}, std::size_t{1}, std::size_t{1024}, whole_.size() / 2, whole_.size() - 1}) {
    int refusals = 0;
    InterruptEveryRead([&] { std::filesystem::resize_file(path_, length); }, false,
                       [&](const Answers& answers) {
                         ExpectAThumbnailOrNone(answers);
                         if (answers.extract == E_FAIL) ++refusals;
                       });
    EXPECT_GT(refusals, 0) << length;
  }
}

TEST_F(ChangingFile, ShowsOldOrNewPixelsWhenItIsOverwritten) {
  const std::string other = FrameBytes('q');
  InterruptEveryRead(
      [&] { std::fstream(path_, std::ios_base::binary | std::ios_base::in | std::ios_base::out) << other; },
      false,
      [&](const Answers& answers) {
        EXPECT_EQ(answers.extract, S_OK);
        EXPECT_EQ(answers.picture.width, picture_.width);
      });
}

TEST_F(ChangingFile, IsRefusedWhenItCannotBeReadAnyMore) {
  // This happens when another program locks a part of the file, or when the medium is removed.
  InterruptEveryRead({}, true, [&](const Answers& answers) { EXPECT_EQ(answers.extract, E_FAIL); });
}

TEST_F(ChangingFile, IsRefusedWhileAnotherProgramHasItOpenExclusively) {
  const HANDLE own =
      CreateFileW(path_.c_str(), GENERIC_READ | GENERIC_WRITE, 0, nullptr, OPEN_EXISTING, 0, nullptr);
  ASSERT_NE(own, INVALID_HANDLE_VALUE);
  EXPECT_EQ(Ask().extract, E_FAIL);
  const auto columns = dll_.CreateInstance<IColumnProvider>(kShellExtClass, IID_IColumnProvider);
  SHCOLUMNDATA item{};
  path_.native().copy(item.wszFile, std::size(item.wszFile) - 1);
  VARIANT value{};
  EXPECT_EQ(columns->GetItemData(&kWidthKey, &item, &value), S_FALSE);
  CloseHandle(own);
  EXPECT_EQ(columns->GetItemData(&kWidthKey, &item, &value), S_OK);
  EXPECT_EQ(TakeValue(value), Number(VT_I4, 700));
  EXPECT_EQ(Ask().picture, picture_);
}

TEST_F(ChangingFile, IsShownAsSoonAsItIsCompletelyWritten) {
  constexpr std::size_t kPiece = 100'000;
  std::filesystem::resize_file(path_, 0);
  std::ofstream writer(path_, std::ios_base::binary);
  for (std::size_t written = 0; written < whole_.size(); written += kPiece) {
    EXPECT_EQ(Ask().extract, E_FAIL) << written;
    writer << whole_.substr(written, kPiece) << std::flush;
  }
  EXPECT_EQ(Ask().picture, picture_);
}

}  // namespace
}  // namespace Qel::Lumetra::ShellExt::Testing
