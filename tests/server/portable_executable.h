// Reads the parts of a Portable Executable file (an EXE or DLL) that the tests check.
#pragma once

#include <cstdint>
#include <filesystem>
#include <map>
#include <set>
#include <string>
#include <vector>

namespace Qel::Lumetra::ShellExt::Testing {

struct PortableExecutable {
  struct Section {
    std::string name;
    std::uint32_t characteristics = 0;
  };

  std::uint16_t machine = 0;
  std::uint16_t fileCharacteristics = 0;
  std::uint16_t dllCharacteristics = 0;
  std::uint32_t timeStamp = 0;
  std::vector<Section> sections;
  std::string code;                                      // the bytes of the section .text
  std::string exportedName;                              // the name of the module in its export table
  std::vector<std::string> exports;                      // in the order of the table
  std::map<std::string, std::set<std::string>> imports;  // functions by module, names in lower case

  /// Reads a 64-bit module. Throws std::exception for any other file.
  static PortableExecutable Read(const std::filesystem::path& path);
};

}  // namespace Qel::Lumetra::ShellExt::Testing
