// qelsamples, the program that writes the sample files into a folder.
#include <cstdio>
#include <filesystem>
#include <fstream>

#include "samples.h"

namespace {

/// Runs the program; the arguments have the character type of the system's paths. Returns the exit status.
int Run(int count, const std::filesystem::path::value_type* const* arguments) {
  namespace fs = std::filesystem;
  if (count != 2 || arguments[1][0] == '-') {
    std::fputs("usage: qelsamples FOLDER\n\nWrites a sample of every supported file kind into FOLDER.\n",
               stderr);
    return 2;
  }
  const fs::path folder = arguments[1];
  std::error_code error;
  fs::create_directories(folder, error);
  for (const auto& sample : Qel::Lumetra::ShellExt::Samples::AllSamples()) {
    std::ofstream file(folder / sample.name, std::ios_base::binary);
    file << sample.make();
    if (!file.flush()) {
      std::fprintf(stderr, "qelsamples: cannot write %s.\n", (folder / sample.name).string().c_str());
      return 1;
    }
  }
  return 0;
}

}  // namespace

#ifdef _WIN32
int wmain(int count, wchar_t** arguments) {
#else
int main(int count, char** arguments) {
#endif
  return Run(count, arguments);
}
