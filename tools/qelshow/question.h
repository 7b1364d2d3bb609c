// What the program asks its worker process (worker.h).
#pragma once

#include <cstdint>
#include <string>

namespace Qel::Lumetra::ShellExt::Show {

/// To load the DLL, about a file, what the shell shows of it, and whether objects of a registered class can
/// be created.
enum class Subject : std::int32_t {
  kLoading,
  kDiagnosis,
  kTip,
  kColumns,
  kPropertySets,
  kPropertyStore,
  kThumbnail,
  kShellView,
  kCreation
};

struct Question {
  Subject subject = Subject::kDiagnosis;
  std::wstring path;      // of the DLL or the file; for kCreation the class identifier
  std::int32_t size = 0;  // of a thumbnail
};

}  // namespace Qel::Lumetra::ShellExt::Show
