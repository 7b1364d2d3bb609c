#include "ask_everything.h"

#include <algorithm>
#include <cstdint>
#include <memory>
#include <numeric>
#include <stdexcept>
#include <tuple>
#include <vector>

#include "file_type_factory.h"
#include "header_facts.h"
#include "read_text.h"

namespace Qel::Lumetra::ShellExt::Testing {
namespace {

auto Metadata(const FileTypeInfo& reader) {
  return std::tuple(reader.GetTypeDescription(), reader.GetDimensions(), reader.GetFrameCount(),
                    reader.GetBitDepth(), reader.GetDataTypeName(), reader.GetComment());
}

/// Makes the reader of `extension`. Returns null after one of the only two exceptions that its constructor
/// may throw.
std::unique_ptr<FileTypeInfo> MakeReader(std::istream& stream, const std::wstring& extension) {
  try {
    return CreateFileTypeInfo(stream, extension);
  } catch (const std::invalid_argument&) {  // an item that is not as deep in the tree as its type requires
    if (!IsEmiExtension(extension)) throw;
  } catch (const std::length_error&) {  // a negative string length
    if (!IsSerExtension(extension)) throw;
  }
  return nullptr;
}

/// Returns the edge, in pixels of the frame, of the blocks that are averaged to one pixel of the thumbnail.
/// This repeats the rule of render/reduction.cpp on purpose: the check must not share code with what it
/// checks.
std::int64_t Factor(Size2 frame, bool colour, const SIZE& request) {
  const std::int64_t factor =
      std::max(std::int64_t{frame.width} / request.cx, std::int64_t{frame.height} / request.cy);
  return colour ? factor : std::max<std::int64_t>(factor, 1);
}

/// Checks the size and pixel format of `bitmap`, reads all of its bytes and deletes it.
void Take(HBITMAP bitmap, Size2 frame, bool colour, const SIZE& request, Answers& answers) {
  DIBSECTION section{};
  if (GetObjectW(bitmap, sizeof section, &section) != static_cast<int>(sizeof section)) {
    answers.wrong = "a thumbnail is not a DIB section";
    return;
  }
  const BITMAP& shape = section.dsBm;
  const std::int64_t factor = Factor(frame, colour, request);
  if (shape.bmWidth != frame.width / factor || shape.bmHeight != frame.height / factor) {
    answers.wrong = "a thumbnail does not have the size that follows from the frame and the request";
  }
  if (shape.bmBitsPixel != (colour ? 24 : 8))
    answers.wrong = "a thumbnail does not have the bit depth of its kind";
  const auto* const bits = static_cast<const std::uint8_t*>(shape.bmBits);
  const std::int64_t bytes = std::int64_t{shape.bmWidthBytes} * shape.bmHeight;
  answers.bitmapSum = std::accumulate(bits, bits + bytes, answers.bitmapSum);
  ++answers.bitmaps;
  DeleteObject(bitmap);
}

}  // namespace

bool TakesLong(Size2 frame) {
  const std::int64_t pixels = std::int64_t{frame.width} * frame.height;
  return pixels > 1 << 16 && pixels < 1 << 27;
}

bool IsRequiredFault(Size2 frame, bool colour, const SIZE& request) {
  return request.cx == 0 || request.cy == 0 || Factor(frame, colour, request) == 0;
}

namespace {

void AskReader(std::istream& stream, const std::wstring& extension, std::span<const SIZE> requests,
               Answers& answers) {
  const std::unique_ptr<FileTypeInfo> reader = MakeReader(stream, extension);
  answers.constructed = reader != nullptr;
  answers.valid = answers.constructed && reader->IsValid();
  if (!answers.valid) return;

  const auto metadata = Metadata(*reader);
  const Size2 frame = reader->GetDimensions();
  const bool colour = reader->GetBitDepth() == 24;
  for (const SIZE& request : requests) {
    if (IsRequiredFault(frame, colour, request) || TakesLong(frame)) continue;
    const HBITMAP bitmap = reader->CreateThumbnail(request);
    if (bitmap != nullptr) Take(bitmap, frame, colour, request, answers);
  }
  if (Metadata(*reader) != metadata) answers.wrong = "the metadata changed when thumbnails were made";
}

void AskHeader(std::istream& stream, const std::wstring& extension, Answers& answers) {
  constexpr std::size_t kMaxFacts = 200;
  const std::vector<HeaderFact> facts = HeaderFacts(stream, extension);
  if (facts.size() > kMaxFacts) answers.wrong = "a header has more facts than a reader may keep";
  for (const HeaderFact& fact : facts) {
    const auto* const text = std::get_if<std::string>(&fact.value);
    if ((text != nullptr && text->size() > kMaxTextBytes) || fact.unit.size() > kMaxTextBytes) {
      answers.wrong = "a text of a header is longer than a reader may keep";
    }
  }
}

}  // namespace

Answers AskEverything(std::istream& stream, const std::wstring& extension, std::span<const SIZE> requests) {
  Answers answers;
  AskReader(stream, extension, requests, answers);
  AskHeader(stream, extension, answers);
  return answers;
}

}  // namespace Qel::Lumetra::ShellExt::Testing
