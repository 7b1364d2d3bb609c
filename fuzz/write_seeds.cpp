// Writes the seeds of the fuzzers, a folder for each kind, below the folder that its argument names.
#include <cstdio>
#include <exception>
#include <filesystem>
#include <fstream>

#include "sample_files.h"

int main(int argc, char** argv) try {
  using namespace Qel::Lumetra::ShellExt::Testing;
  if (argc != 2) throw std::invalid_argument("name the folder to write to");
  for (const char* kind : kFileKinds) {
    const std::filesystem::path folder = std::filesystem::path(argv[1]) / kind;
    std::filesystem::create_directories(folder);
    for (const SampleFile& sample : SampleFiles(kind)) {
      std::ofstream file(folder / sample.name, std::ios_base::binary);
      file.exceptions(std::ios_base::badbit | std::ios_base::failbit);
      file << sample.bytes << std::flush;
    }
  }
} catch (const std::exception& failure) {
  std::fprintf(stderr, "write_seeds: %s\n", failure.what());
  return 1;
}
