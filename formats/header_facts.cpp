#include "header_facts.h"

#include <exception>

#include "file_kinds.h"

namespace Qel::Lumetra::ShellExt {
namespace {

using Facts = std::vector<HeaderFact>;

/// All that its users look for is in the answers that every file has.
Facts FactsOf(const MrcParser&) {
  return {};
}

Facts FactsOf(const RawParser& parser) {
  if (!parser.IsValid()) return {};
  const FrameLayout& frame = parser.frame();
  return {{"Offset of the first pixel", frame.firstPixel, "B"},
          {"Pixel stride", frame.pixelStride, "B"},
          {"Row stride", frame.rowStride, "B"}};
}

Facts FactsOf(const EbnParser& parser) {
  if (!parser.IsValid()) return {};
  const EbnInstrument& instrument = parser.instrument();
  return {{"Microscope model code", instrument.model},
          {"Electron source code", instrument.source},
          {"Objective lens code", instrument.lens},
          {"D number", instrument.dNumber},
          {"Accelerating voltage", instrument.kilovolts, "kV"}};
}

Facts FactsOf(const SerParser&) {
  return {};
}

Facts FactsOf(const EmiParser&) {
  return {};
}

}  // namespace

std::vector<HeaderFact> HeaderFacts(std::istream& stream, const std::wstring& extension) {
  stream.clear();
  stream.seekg(0);
  Facts facts;
  WithKindOf(extension, [&]<class KindParser>(const FileKind<KindParser>&) {
    try {
      facts = FactsOf(KindParser(stream));
    } catch (const std::exception&) {
      // Why the contents cannot be followed is explained by ExplainFault.
    }
  });
  return facts;
}

}  // namespace Qel::Lumetra::ShellExt
