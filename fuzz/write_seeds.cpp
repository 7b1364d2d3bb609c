// Writes the seeds of the fuzzers into the folder that its argument names, with a subfolder for each kind.
#include <cstdio>
#include <exception>
#include <filesystem>
#include <fstream>
#include <random>
#include <stdexcept>
#include <string>

#include "sample_files.h"

namespace {

using namespace Qel::Lumetra::ShellExt::Testing;

constexpr const char* kScripts[] = {
    "",
    "HKCR {}",
    "HKLM { A }",
    "HKCR { A { B { C } D } E } HKLM { F } HKCR { G }",
    "hkcr { forceremove A noremove B }",
    "HKCR { A = s 'text' B = s bare C = d '1' D = d 4294967295 }",
    "HKCR { A { val B = s 'it''s' val 'c d' = d 0 val '' = s '' } }",
    "HKCR { '%APPID%' = s '%MODULE%' }",
    "HKCR { 'val' { 'ForceRemove' 'NoRemove' } }",
    "HKLM { Software { Classes { CLSID { ForceRemove '{1}' = s x { val y = s z } } } } }",
    "HKCR{A=s'x'{val B=d'2'}}\r\n\t",
    "HKCR { %% }",
};

void Write(const std::filesystem::path& folder, const std::string& name, const std::string& bytes) {
  std::filesystem::create_directories(folder);
  std::ofstream file(folder / name, std::ios_base::binary);
  file.exceptions(std::ios_base::badbit | std::ios_base::failbit);
  file << bytes << std::flush;
}

}  // namespace

int main(int argc, char** argv) try {
  if (argc != 2) throw std::invalid_argument("name the output folder as the only argument");
  const std::filesystem::path seeds = argv[1];
  for (const char* kind : kSampleKinds) {
    for (const SampleFile& sample : SampleFiles(kind)) Write(seeds / kind, sample.name, sample.bytes);
  }
  int number = 0;
  for (const char* script : kScripts) Write(seeds / "registrar", std::to_string(++number), script);
  // What these bytes mean to the fuzzer of basic_combuf does not matter. Only their number does.
  std::mt19937 random;
  for (std::size_t size = 20; size <= 400; size += 20) {
    std::string bytes(size, '\0');
    for (char& byte : bytes) byte = static_cast<char>(random() % (size % 40 == 0 ? 256 : 16));
    Write(seeds / "combuf", std::to_string(size), bytes);
  }
} catch (const std::exception& failure) {
  std::fprintf(stderr, "write_seeds: %s\n", failure.what());
  return 1;
}
