#include "portable_executable.h"

#include <windows.h>

#include <algorithm>
#include <cctype>
#include <cstring>
#include <fstream>
#include <iterator>
#include <stdexcept>

namespace Qel::Lumetra::ShellExt::Testing {
namespace {

/// The bytes of a module's file, addressed by their offset in memory once the module is loaded.
class Image {
 public:
  explicit Image(const std::filesystem::path& path) {
    std::ifstream file(path, std::ios::binary);
    bytes_.assign(std::istreambuf_iterator<char>(file), std::istreambuf_iterator<char>());
    const auto dos = AtOffset<IMAGE_DOS_HEADER>(0);
    headers_ = AtOffset<IMAGE_NT_HEADERS64>(static_cast<std::size_t>(dos.e_lfanew));
    if (headers_.OptionalHeader.Magic != IMAGE_NT_OPTIONAL_HDR64_MAGIC) {
      throw std::runtime_error("not a 64-bit module: " + path.string());
    }
    const std::size_t start = static_cast<std::size_t>(dos.e_lfanew) + sizeof headers_;
    for (std::size_t i = 0; i < headers_.FileHeader.NumberOfSections; ++i) {
      sections_.push_back(AtOffset<IMAGE_SECTION_HEADER>(start + i * sizeof(IMAGE_SECTION_HEADER)));
    }
  }

  const IMAGE_NT_HEADERS64& headers() const { return headers_; }
  const std::vector<IMAGE_SECTION_HEADER>& sections() const { return sections_; }

  DWORD Directory(std::size_t index) const {
    return headers_.OptionalHeader.DataDirectory[index].VirtualAddress;
  }

  template <class Struct>
  Struct At(std::size_t address) const {
    return AtOffset<Struct>(Offset(address));
  }

  std::string Bytes(const IMAGE_SECTION_HEADER& section) const {
    return bytes_.substr(section.PointerToRawData, section.SizeOfRawData);
  }

  std::string Text(std::size_t address) const { return bytes_.c_str() + Offset(address); }

 private:
  template <class Struct>
  Struct AtOffset(std::size_t offset) const {
    Struct value;
    if (offset > bytes_.size() || bytes_.size() - offset < sizeof value) {
      throw std::out_of_range("outside the module");
    }
    std::memcpy(&value, bytes_.data() + offset, sizeof value);
    return value;
  }

  std::size_t Offset(std::size_t address) const {
    for (const IMAGE_SECTION_HEADER& section : sections_) {
      if (address >= section.VirtualAddress && address - section.VirtualAddress < section.SizeOfRawData) {
        return address - section.VirtualAddress + section.PointerToRawData;
      }
    }
    throw std::out_of_range("in no section of the module");
  }

  std::string bytes_;
  IMAGE_NT_HEADERS64 headers_{};
  std::vector<IMAGE_SECTION_HEADER> sections_;
};

std::string Lower(std::string text) {
  std::ranges::transform(text, text.begin(),
                         [](unsigned char letter) { return static_cast<char>(std::tolower(letter)); });
  return text;
}

void ReadExports(const Image& image, PortableExecutable& module) {
  const auto table = image.At<IMAGE_EXPORT_DIRECTORY>(image.Directory(IMAGE_DIRECTORY_ENTRY_EXPORT));
  module.exportedName = image.Text(table.Name);
  if (table.NumberOfFunctions != table.NumberOfNames) throw std::runtime_error("exports without a name");
  for (std::size_t i = 0; i < table.NumberOfNames; ++i) {
    module.exports.push_back(image.Text(image.At<DWORD>(table.AddressOfNames + i * sizeof(DWORD))));
  }
}

void ReadImports(const Image& image, PortableExecutable& module) {
  for (std::size_t entry = image.Directory(IMAGE_DIRECTORY_ENTRY_IMPORT);;
       entry += sizeof(IMAGE_IMPORT_DESCRIPTOR)) {
    const auto descriptor = image.At<IMAGE_IMPORT_DESCRIPTOR>(entry);
    if (descriptor.Name == 0) break;
    auto& functions = module.imports[Lower(image.Text(descriptor.Name))];
    for (std::size_t thunk = descriptor.FirstThunk;; thunk += sizeof(ULONGLONG)) {
      const auto name = image.At<ULONGLONG>(thunk);
      if (name == 0) break;
      if (IMAGE_SNAP_BY_ORDINAL64(name)) throw std::runtime_error("imports without a name");
      functions.insert(Lower(image.Text(static_cast<std::size_t>(name) + sizeof(WORD))));
    }
  }
}

}  // namespace

PortableExecutable PortableExecutable::Read(const std::filesystem::path& path) {
  const Image image(path);
  PortableExecutable module;
  module.machine = image.headers().FileHeader.Machine;
  module.fileCharacteristics = image.headers().FileHeader.Characteristics;
  module.dllCharacteristics = image.headers().OptionalHeader.DllCharacteristics;
  module.timeStamp = image.headers().FileHeader.TimeDateStamp;
  for (const IMAGE_SECTION_HEADER& section : image.sections()) {
    const auto* const name = reinterpret_cast<const char*>(section.Name);
    module.sections.push_back({{name, strnlen(name, sizeof section.Name)}, section.Characteristics});
    if (module.sections.back().name == ".text") module.code = image.Bytes(section);
  }
  ReadExports(image, module);
  ReadImports(image, module);
  return module;
}

}  // namespace Qel::Lumetra::ShellExt::Testing
