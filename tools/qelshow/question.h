// The questions that the program sends to its worker process (worker.h).
#pragma once

#include <cstdint>
#include <string>

namespace Qel::Lumetra::ShellExt::Show {

/// What a question is about: whether the DLL can be loaded, the diagnosis of a file by the project's own
/// readers, one of the extension's answers about a file, what the shell shows for it, or whether objects of a
/// registered class can be created.
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
  std::wstring path;      // the path of the DLL or the file; for kCreation the class identifier
  std::int32_t size = 0;  // the edge of the requested thumbnail
};

}  // namespace Qel::Lumetra::ShellExt::Show
