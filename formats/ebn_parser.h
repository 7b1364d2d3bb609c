// .ebn files: one image after a header that also describes the microscope in five numbers.
#pragma once

#include <istream>
#include <string>

#include "file_parser.h"

namespace Qel::Lumetra::ShellExt {

/// The fields of the header that describe the microscope, in the order of the file. The first three are
/// codes.
struct EbnInstrument {
  double model = 0;
  double source = 0;
  double lens = 0;
  double dNumber = 0;
  double kilovolts = 0;
};

class EbnParser final : public FileParser {
 public:
  explicit EbnParser(std::istream& stream);

  const EbnInstrument& instrument() const { return instrument_; }

  /// Returns the microscope in one line, for instance "Halden 20 FEG 200.0 kV".
  const std::string& comment() const { return comment_; }

 private:
  EbnInstrument instrument_;
  std::string comment_;
};

}  // namespace Qel::Lumetra::ShellExt
