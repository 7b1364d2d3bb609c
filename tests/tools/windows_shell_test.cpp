// Compares what the shell of this computer shows for the sample files with what the extension itself returns.
// The extension is registered while a test runs.
#include <gtest/gtest.h>
#include <windows.h>

#include <cstring>
#include <filesystem>
#include <fstream>
#include <string>
#include <vector>

#include "dll_registration.h"
#include "file_facts.h"
#include "machine_registration.h"
#include "samples.h"
#include "shell_view.h"
#include "temp_folder.h"
#include "text_tools.h"
#include "worker.h"

namespace Qel::Lumetra::ShellExt::Show {
namespace {

constexpr std::int32_t kRequest = 256;

/// Keeps the DLL registered while it exists. The destructor restores what the registration has replaced.
class RegisteredDll {
 public:
  RegisteredDll() { EXPECT_EQ(dll_.Register(), S_OK); }
  ~RegisteredDll() { EXPECT_EQ(dll_.Unregister(), S_OK); }
  RegisteredDll(const RegisteredDll&) = delete;
  RegisteredDll& operator=(const RegisteredDll&) = delete;

 private:
  Testing::SavedRegistrations others_;
  Testing::DllRegistration dll_;
};

struct SampleView {
  std::wstring path;
  ShellView view;
};

class WindowsShell : public testing::Test {
 protected:
  void SetUp() override {
    if (const std::string reason = Testing::ReasonNotToRegister(); !reason.empty()) GTEST_SKIP() << reason;
  }

  /// Returns what the shell shows of every sample, except those whose thumbnail request crashes.
  std::vector<SampleView> AskForSamples() {
    const RegisteredDll registered;
    Worker worker{std::wstring()};
    std::vector<SampleView> views;
    for (const Samples::Sample& sample : Samples::AllSamples()) {
      const std::wstring path = folder_.Write(sample.name, sample.make()).wstring();
      ThumbnailAnswer answer;
      if (worker.Ask({Subject::kThumbnail, path, kRequest}, answer)) continue;
      SampleView asked{path, {}};
      const auto end = worker.Ask({Subject::kShellView, path, kRequest}, asked.view);
      EXPECT_FALSE(end) << sample.name << ": the shell crashed: " << Utf8(ProcessEndText(*end));
      views.push_back(std::move(asked));
    }
    EXPECT_GT(views.size(), 20u);
    return views;
  }

  /// Compares one kind of answer for every sample. Skips the test if the shell answers for none.
  void Compare(ShellAnswer ShellView::* answer) {
    bool isAnswered = false;
    for (const SampleView& asked : AskForSamples()) {
      const Agreement agreement = (asked.view.*answer).agreement;
      if (agreement != Agreement::kUnanswered) isAnswered = true;
      EXPECT_TRUE(agreement != Agreement::kDiffers && agreement != Agreement::kNothing)
          << Utf8(asked.path) << ": " << Utf8(ShellText(asked.view, asked.path));
    }
    if (!isAnswered && !HasFailure()) GTEST_SKIP() << "This system does not report what it shows for a file.";
  }

  const Testing::TempFolder folder_;
};

TEST_F(WindowsShell, ShowsTheThumbnailsOfTheExtension) {
  Compare(&ShellView::thumbnail);
}

TEST_F(WindowsShell, ShowsThePropertiesOfTheExtension) {
  Compare(&ShellView::properties);
}

}  // namespace
}  // namespace Qel::Lumetra::ShellExt::Show

/// Runs the tests, or with --worker the worker process, which is this program too.
int main(int count, char** arguments) {
  if (count == 2 && std::strcmp(arguments[1], "--worker") == 0)
    return Qel::Lumetra::ShellExt::Show::RunWorker();
  testing::InitGoogleTest(&count, arguments);
  return RUN_ALL_TESTS();
}
