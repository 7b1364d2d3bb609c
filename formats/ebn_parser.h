// .ebn files: one image behind a header that also describes the microscope in five numbers.
#pragma once

#include <istream>
#include <string>

#include "file_parser.h"

namespace Qel::Lumetra::ShellExt {

class EbnParser final : public FileParser {
 public:
  explicit EbnParser(std::istream& stream);

  /// The microscope in one line, for instance "Halden 20 FEG 200.0 kV".
  const std::string& comment() const { return comment_; }

 private:
  std::string comment_;
};

}  // namespace Qel::Lumetra::ShellExt
