#include "header_facts.h"

#include <exception>

#include "data_type.h"
#include "file_kinds.h"

namespace Qel::Lumetra::ShellExt {
namespace {

using Facts = std::vector<HeaderFact>;

/// Returns nothing, because FileTypeInfo already has every value of an MRC header that users want to see.
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

void Add(Facts& facts, const std::string& name, const SerCalibration& calibration,
         const std::string& unit = {}) {
  facts.push_back({name + " calibration offset", calibration.offset, unit});
  facts.push_back({name + " calibration delta", calibration.delta, unit});
  facts.push_back({name + " calibration element", calibration.element});
}

void AddIfAny(Facts& facts, const std::string& name, const std::string& text) {
  if (!text.empty()) facts.push_back({name, text});
}

Facts FactsOf(const SerParser& parser) {
  Facts facts;
  if (const auto& series = parser.series()) {
    facts.push_back({"Tags", series->hasPositionTags ? "positions" : "times"});
    facts.push_back({"Number of dimensions", series->dimensionCount});
    for (std::size_t i = 0; i < series->dimensions.size(); ++i) {
      const SerDimension& dimension = series->dimensions[i];
      const std::string name = "Dimension " + std::to_string(i + 1);
      facts.push_back({name + " size", dimension.dimensionSize});
      Add(facts, name, dimension.calibration, dimension.units);
      AddIfAny(facts, name + " description", dimension.description);
      AddIfAny(facts, name + " units", dimension.units);
    }
  }
  if (const auto& element = parser.element()) {
    Add(facts, "X", element->calibrationX);
    Add(facts, "Y", element->calibrationY);
  }
  return facts;
}

void AddLabels(Facts& facts, const std::string& name, const EmiDataObject& object) {
  AddIfAny(facts, name + " label 100", object.label100);
  AddIfAny(facts, name + " label 419", object.label419);
  AddIfAny(facts, name + " label 400", object.label400);
  AddIfAny(facts, name + " label 440", object.label440);
}

void AddExtraValues(Facts& facts, const std::string& name, const EmiDataObject& object) {
  if (object.extraValue1) facts.push_back({name + " extra value 1", *object.extraValue1});
  if (object.extraValue2) facts.push_back({name + " extra value 2", *object.extraValue2});
}

Facts FactsOf(const EmiParser& parser) {
  Facts facts;
  AddLabels(facts, "Image", parser.image());
  AddExtraValues(facts, "Image", parser.image());
  if (parser.lineDataCount() == 0) return facts;
  const EmiLineData& line = parser.lineData();
  facts.push_back({"Number of lines", static_cast<std::int64_t>(parser.lineDataCount())});
  AddLabels(facts, "Line", line);
  if (line.dataType) {
    const std::wstring type = DataTypeName(*line.dataType);
    facts.push_back({"Line length", line.length, "values"});
    facts.push_back({"Line type", std::string(type.begin(), type.end())});
  }
  AddExtraValues(facts, "Line", line);
  return facts;
}

}  // namespace

std::vector<HeaderFact> HeaderFacts(std::istream& stream, const std::wstring& extension) {
  stream.clear();
  stream.seekg(0);
  Facts facts;
  WithKindOf(extension, [&]<class KindParser>(const FileKind<KindParser>&) {
    try {
      facts = FactsOf(KindParser(stream));
    } catch (const std::exception&) {  // NOLINT(bugprone-empty-catch)
      // ExplainFault explains why the contents cannot be read.
    }
  });
  return facts;
}

}  // namespace Qel::Lumetra::ShellExt
