#include "frame_reader.h"

#include <algorithm>
#include <cstdint>
#include <cstdlib>
#include <memory>
#include <utility>

#include "frame_renderer.h"

namespace Qel::Lumetra::ShellExt {
namespace {

// Large enough to read at the speed of the page cache, small enough to stay in the processor's cache while
// the band is reduced.
constexpr std::int64_t kBandBytes = 256LL * 1024;

// Strides can make pixels share their bytes, so that a small file claims a picture of any size. Such a
// picture is refused when it has more pixels than bytes and more than this, which bounds the memory that a
// file of a few bytes can take to 512 KiB (a double for each pixel).
constexpr std::int64_t kMaxSharedPixels = 64LL * 1024;

// Bands are given up for single columns if they would read the block more often than this, and single columns
// for the whole block at once.
constexpr std::int64_t kMaxPasses = 8;

// A shorter read takes as long as one of this many bytes.
constexpr std::int64_t kMinReadBytes = 1024;

// Strides can interleave rows and columns so that no part of the picture is contiguous in the file. No
// program writes such a picture, but a few bytes of header can claim one. It is read as a whole, and refused
// if its block is larger than this.
constexpr std::int64_t kMaxInterleavedBytes = 16LL * 1024 * 1024;

/// Whether the layout has pixels, all inside its block, and not too many for its bytes.
bool IsReadable(const FrameLayout& layout) {
  if (layout.size.width < 1 || layout.size.height < 1) return false;
  const std::int64_t pixels = std::int64_t{layout.size.width} * layout.size.height;
  if (pixels > std::max(layout.blockBytes, kMaxSharedPixels)) return false;
  const std::int64_t right = (layout.size.width - std::int64_t{1}) * layout.pixelStride;
  const std::int64_t down = (layout.size.height - std::int64_t{1}) * layout.rowStride;
  const std::int64_t first =
      layout.firstPixel + std::min<std::int64_t>(right, 0) + std::min<std::int64_t>(down, 0);
  const std::int64_t last =
      layout.firstPixel + std::max<std::int64_t>(right, 0) + std::max<std::int64_t>(down, 0);
  return first >= 0 && last + layout.type.bytes() <= layout.blockBytes;
}

/// Whether the stream holds the layout's whole block, so that a truncated file is refused before any work. If
/// not, the stream is left as by a short read.
bool HoldsBlock(std::istream& stream, const FrameLayout& layout) {
  if (layout.blockPosition < 0) {
    stream.setstate(std::ios_base::failbit);
    return false;
  }
  stream.seekg(0, std::ios_base::end);
  const std::int64_t size = stream.tellg();
  if (!stream.good()) return false;
  if (size - layout.blockPosition >= layout.blockBytes) return true;
  stream.setstate(std::ios_base::eofbit | std::ios_base::failbit);
  return false;
}

/// Reads the pixels that a renderer takes, through one buffer, and passes them on in pieces.
class BandReader {
 public:
  BandReader(std::istream& stream, const FrameLayout& layout, FrameRenderer& renderer)
      : stream_(stream),
        layout_(layout),
        renderer_(renderer),
        factor_(renderer.reduction().factor),
        width_(renderer.reduction().Covered().width),
        height_(renderer.reduction().Covered().height),
        pixelBytes_(layout.type.bytes()),
        pixelStep_(std::abs(layout.pixelStride)),
        rowStep_(std::abs(layout.rowStride)) {
    Allocate(std::min(kBandBytes, layout.blockBytes));
  }

  bool ReadFrame() {
    const std::int32_t rows = RowsThatFit(width_);
    const std::int64_t bands = Pieces(height_, std::max(rows, 1));
    if (IsEconomical(bands, Span(width_, std::max(rows, 1)))) return ReadBands(rows);

    const ColumnPieces pieces = SizeOfColumnPieces();
    const std::int64_t columns = width_ * Pieces(height_, pieces.rows);
    if (IsEconomical(columns, std::max(Span(1, pieces.rows), kMinReadBytes))) return ReadBlockColumns(pieces);

    if (layout_.blockBytes > kMaxInterleavedBytes) return false;
    Allocate(layout_.blockBytes);
    return ReadBands(height_);
  }

 private:
  /// Parts of columns that are read one by one and passed on side by side.
  struct ColumnPieces {
    std::int32_t columns;
    std::int32_t rows;
  };

  void Allocate(std::int64_t bytes) {
    bufferBytes_ = bytes;
    buffer_ = std::make_unique_for_overwrite<std::byte[]>(static_cast<std::size_t>(bytes));
  }

  static std::int64_t Pieces(std::int64_t count, std::int64_t max) { return (count + max - 1) / max; }

  bool IsEconomical(std::int64_t reads, std::int64_t bytesOfEach) const {
    return reads * bytesOfEach / kMaxPasses <= layout_.blockBytes;
  }

  /// Bytes from the first to the last byte of a rectangle of pixels.
  std::int64_t Span(std::int64_t columns, std::int64_t rows) const {
    return (columns - 1) * pixelStep_ + (rows - 1) * rowStep_ + pixelBytes_;
  }

  /// How many rows or columns, `step` bytes apart, begin within `bytes` bytes; at most `max`.
  static std::int32_t StepsThatFit(std::int64_t bytes, std::int64_t step, std::int32_t max) {
    if (bytes < 0) return 0;
    return step == 0 ? max : static_cast<std::int32_t>(std::min<std::int64_t>(max, bytes / step + 1));
  }

  std::int32_t RowsThatFit(std::int32_t columns) const {
    return StepsThatFit(bufferBytes_ - Span(columns, 1), rowStep_, height_);
  }

  /// Reads bands of whole rows in the order of the file, from the bottom for a bottom-up frame. A row of
  /// blocks larger than the buffer is read in parts from its top, because that is the order of its sums.
  bool ReadBands(std::int32_t rowsThatFit) {
    const std::int32_t bandRows = std::max(rowsThatFit / factor_, 1) * factor_;
    const std::int32_t bands = (height_ + bandRows - 1) / bandRows;
    for (std::int32_t i = 0; i < bands; ++i) {
      const std::int32_t top = (layout_.rowStride < 0 ? bands - 1 - i : i) * bandRows;
      const std::int32_t end = std::min(bandRows, height_ - top) + top;
      for (std::int32_t y = top; y < end;) {
        const std::int32_t rows = std::min(std::max(rowsThatFit, 1), end - y);
        if (!(rowsThatFit > 0 ? ReadPiece(0, y, width_, rows) : ReadRowInParts(y))) return false;
        y += rows;
      }
    }
    return true;
  }

  /// Reads a row that is larger than the buffer.
  bool ReadRowInParts(std::int32_t y) {
    const std::int32_t columns = StepsThatFit(bufferBytes_ - pixelBytes_, pixelStep_, width_);
    for (std::int32_t x = 0; x < width_; x += columns) {
      if (!ReadPiece(x, y, std::min(columns, width_ - x), 1)) return false;
    }
    return true;
  }

  /// Reads a frame whose columns are contiguous in the file: one column of blocks after the other, each pixel
  /// column by itself.
  bool ReadBlockColumns(const ColumnPieces& pieces) {
    const auto [columns, rows] = pieces;
    for (std::int32_t left = 0; left < width_; left += factor_) {
      for (std::int32_t y = 0; y < height_; y += rows) {
        for (std::int32_t x = left; x < left + factor_; x += columns) {
          if (!ReadColumnsPiece(x, y, std::min(columns, left + factor_ - x), std::min(rows, height_ - y))) {
            return false;
          }
        }
      }
    }
    return true;
  }

  ColumnPieces SizeOfColumnPieces() const {
    const auto maxColumns = static_cast<std::int32_t>(bufferBytes_ / pixelBytes_);
    const std::int32_t columns = std::min(factor_, maxColumns);
    const std::int32_t maxRows = StepsThatFit(bufferBytes_ / columns - pixelBytes_, rowStep_, height_);
    // Blocks wider than the buffer are read a row at a time, to keep the order of their sums.
    return {columns, columns < factor_ ? 1 : maxRows};
  }

  /// Reads a rectangle of pixels with all bytes between its first and its last pixel.
  bool ReadPiece(std::int32_t x, std::int32_t y, std::int32_t columns, std::int32_t rows) {
    const std::int64_t right = (columns - std::int64_t{1}) * layout_.pixelStride;
    const std::int64_t down = (rows - std::int64_t{1}) * layout_.rowStride;
    const std::int64_t before = -(std::min<std::int64_t>(right, 0) + std::min<std::int64_t>(down, 0));
    if (!ReadBytes(PixelPosition(x, y) - before, 0, Span(columns, rows))) return false;
    renderer_.Add({x,
                   y,
                   {columns, rows, &buffer_[static_cast<std::size_t>(before)], layout_.pixelStride,
                    layout_.rowStride}});
    return true;
  }

  /// Reads a rectangle of pixels column by column, without the bytes between the columns.
  bool ReadColumnsPiece(std::int32_t x, std::int32_t y, std::int32_t columns, std::int32_t rows) {
    const std::int64_t columnBytes = Span(1, rows);
    const std::int64_t before = layout_.rowStride < 0 ? columnBytes - pixelBytes_ : 0;
    for (std::int32_t column = 0; column < columns; ++column) {
      if (!ReadBytes(PixelPosition(x + column, y) - before, column * columnBytes, columnBytes)) return false;
    }
    renderer_.Add(
        {x, y, {columns, rows, &buffer_[static_cast<std::size_t>(before)], columnBytes, layout_.rowStride}});
    return true;
  }

  std::int64_t PixelPosition(std::int32_t x, std::int32_t y) const {
    return layout_.blockPosition + layout_.firstPixel + x * layout_.pixelStride + y * layout_.rowStride;
  }

  /// Reads `count` bytes from file offset `position` to byte `offset` of the buffer.
  bool ReadBytes(std::int64_t position, std::int64_t offset, std::int64_t count) {
    if (position != position_) stream_.seekg(position);
    std::byte* const bytes = &buffer_[static_cast<std::size_t>(offset)];
    stream_.read(reinterpret_cast<char*>(bytes), count);
    position_ = position + count;
    if (layout_.swapBytes) {
      for (std::int64_t i = 0; i + 1 < count; i += 2) std::swap(bytes[i], bytes[i + 1]);
    }
    return stream_.good();
  }

  std::istream& stream_;
  const FrameLayout& layout_;
  FrameRenderer& renderer_;
  std::int32_t factor_;
  std::int32_t width_;  // of the whole blocks
  std::int32_t height_;
  std::int64_t pixelBytes_;
  std::int64_t pixelStep_;
  std::int64_t rowStep_;
  std::int64_t bufferBytes_ = 0;
  std::unique_ptr<std::byte[]> buffer_;
  std::int64_t position_ = -1;  // of the stream; -1 if unknown
};

}  // namespace

HBITMAP ReadThumbnail(std::istream& stream, const FrameLayout& layout, const SIZE& request) {
  if (!IsReadable(layout) || !HoldsBlock(stream, layout)) return nullptr;
  const auto renderer = MakeFrameRenderer(layout.type.tag, layout.size, request);
  if (renderer == nullptr) return nullptr;
  const bool hasBlocks = renderer->reduction().HasBlocks();
  if (hasBlocks && !BandReader(stream, layout, *renderer).ReadFrame()) return nullptr;
  return renderer->Finish();
}

}  // namespace Qel::Lumetra::ShellExt
