#include "frame_reader.h"

#include <algorithm>
#include <cmath>
#include <cstdint>
#include <cstdlib>
#include <cstring>
#include <memory>
#include <utility>

#include "frame_renderer.h"

namespace Qel::Lumetra::ShellExt {
namespace {

// Large enough to read at the speed of the page cache, small enough to stay in the processor's cache while
// the band is reduced.
constexpr std::int64_t kBandBytes = 256LL * 1024;

// Strides can make pixels overlap in the file, so that a small file claims a frame of any size. A frame
// may have this many more pixels than bytes. The maximum limits the time for a file of a few bytes.
constexpr std::int64_t kMaxSharedPixels = 1LL << 26;

// If bands would read the block more often than this, tiles are read instead.
constexpr std::int64_t kMaxPasses = 8;

// Reading fewer bytes than this takes the same time.
constexpr std::int64_t kMinReadBytes = 4096;

// Strides can scatter a frame so widely that each read returns only a few of its pixels. No program writes
// such a frame, but a few bytes of header can claim one. It is rejected if its reads have more bytes in
// total than this, which limits its time to a few seconds.
constexpr std::int64_t kMaxTileReadBytes = 1LL << 34;

/// Returns whether the stream contains the layout's whole block, so that a truncated file is rejected before
/// any work. If not, the stream is left failed, as after a short read.
bool HoldsBlock(std::istream& stream, const FrameLayout& layout) {
  stream.seekg(0, std::ios_base::end);
  const std::int64_t size = stream.tellg();
  if (!stream.good()) return false;
  if (size - layout.blockPosition >= layout.blockBytes) return true;
  stream.setstate(std::ios_base::eofbit | std::ios_base::failbit);
  return false;
}

/// Reads the pixels that a renderer needs, through one buffer, and passes them on in pieces.
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
    bufferBytes_ = std::min(kBandBytes, layout.blockBytes);
    buffer_ = std::make_unique_for_overwrite<std::byte[]>(static_cast<std::size_t>(bufferBytes_));
  }

  bool ReadFrame() {
    const std::int32_t rows = RowsThatFit(width_);
    const std::int64_t bands = Pieces(height_, std::max(rows, 1));
    const bool isEconomical = bands * Span(width_, std::max(rows, 1)) / kMaxPasses <= layout_.blockBytes;
    return isEconomical ? ReadBands(rows) : ReadTiles();
  }

 private:
  /// A rectangle of the frame's pixels.
  struct Rectangle {
    std::int32_t x;
    std::int32_t y;
    std::int32_t columns;
    std::int32_t rows;

    std::int64_t Pixels() const { return std::int64_t{columns} * rows; }
  };

  static std::int64_t Pieces(std::int64_t count, std::int64_t max) { return (count + max - 1) / max; }

  /// Returns the number of bytes from the first to the last byte of a rectangle of pixels.
  std::int64_t Span(std::int64_t columns, std::int64_t rows) const {
    return (columns - 1) * pixelStep_ + (rows - 1) * rowStep_ + pixelBytes_;
  }

  /// Returns how many rows or columns, `step` bytes apart, begin at offsets from 0 to `bytes`, both included;
  /// at most `max`.
  static std::int32_t StepsThatFit(std::int64_t bytes, std::int64_t step, std::int32_t max) {
    if (bytes < 0) return 0;
    return step == 0 ? max : static_cast<std::int32_t>(std::min<std::int64_t>(max, bytes / step + 1));
  }

  std::int32_t RowsThatFit(std::int32_t columns) const {
    return StepsThatFit(bufferBytes_ - Span(columns, 1), rowStep_, height_);
  }

  /// Reads bands of whole rows in file order, so a bottom-up frame is read from its bottom. A row of blocks
  /// larger than the buffer is read in parts from its top, because its sums require that order.
  bool ReadBands(std::int32_t rowsThatFit) {
    const std::int32_t bandRows = std::max(rowsThatFit / factor_, 1) * factor_;
    const std::int32_t bands = (height_ + bandRows - 1) / bandRows;
    for (std::int32_t i = 0; i < bands; ++i) {
      const std::int32_t top = (layout_.rowStride < 0 ? bands - 1 - i : i) * bandRows;
      const std::int32_t end = std::min(bandRows, height_ - top) + top;
      for (std::int32_t y = top; y < end;) {
        const std::int32_t rows = std::min(std::max(rowsThatFit, 1), end - y);
        if (!(rowsThatFit > 0 ? ReadPiece({0, y, width_, rows}) : ReadRowInParts(y))) return false;
        y += rows;
      }
    }
    return true;
  }

  /// Reads a row that is larger than the buffer.
  bool ReadRowInParts(std::int32_t y) {
    const std::int32_t columns = StepsThatFit(bufferBytes_ - pixelBytes_, pixelStep_, width_);
    for (std::int32_t x = 0; x < width_; x += columns) {
      if (!ReadPiece({x, y, std::min(columns, width_ - x), 1})) return false;
    }
    return true;
  }

  /// Reads in tiles a frame that bands would read too often (kMaxPasses). The pixels of a tile are collected
  /// from as many reads as necessary. A tile has the width of whole blocks, and the tiles of a column are
  /// read from the top down, so that every block gets its rows from the top.
  bool ReadTiles() {
    const std::int64_t maxPixels = kBandBytes / pixelBytes_;
    if (factor_ > maxPixels) return false;
    const Rectangle tile = FirstTile(maxPixels);
    std::int64_t bytes = 0;
    SplitIntoReads(tile, [&](const Rectangle& part) {
      bytes += std::max(Span(part.columns, part.rows), kMinReadBytes);
      return true;
    });
    const std::int64_t tiles = Pieces(width_, tile.columns) * Pieces(height_, tile.rows);
    if (tiles > kMaxTileReadBytes / bytes) return false;

    tile_ =
        std::make_unique_for_overwrite<std::byte[]>(static_cast<std::size_t>(tile.Pixels() * pixelBytes_));
    for (std::int32_t x = 0; x < width_; x += tile.columns) {
      for (std::int32_t y = 0; y < height_; y += tile.rows) {
        if (!ReadTile({x, y, std::min(tile.columns, width_ - x), std::min(tile.rows, height_ - y)}))
          return false;
      }
    }
    return true;
  }

  /// Returns a tile of a size that needs few reads: it spans about as many bytes from left to right as from
  /// top to bottom.
  Rectangle FirstTile(std::int64_t maxPixels) const {
    const double ratio =
        static_cast<double>(rowStep_) / static_cast<double>(std::max<std::int64_t>(pixelStep_, 1));
    const double square =
        std::min(std::sqrt(static_cast<double>(maxPixels) * ratio), static_cast<double>(maxPixels));
    const auto minColumns = std::max(static_cast<std::int32_t>(square), factor_);
    const auto rows = static_cast<std::int32_t>(std::min<std::int64_t>(maxPixels / minColumns, height_));
    const auto columns = static_cast<std::int32_t>(std::min<std::int64_t>(maxPixels / rows, width_));
    return {0, 0, columns / factor_ * factor_, rows};
  }

  /// Splits `whole` into rectangles that are small enough for the buffer and dense enough for one read, and
  /// calls `read` with each until it returns false. Returns whether all calls returned true.
  template <class Read>
  // NOLINTNEXTLINE(misc-no-recursion): each call halves the rectangle
  bool SplitIntoReads(const Rectangle& whole, const Read& read) const {
    const std::int64_t span = Span(whole.columns, whole.rows);
    if (span <= std::min(bufferBytes_, whole.Pixels() * kMinReadBytes)) return read(whole);
    Rectangle first = whole;
    Rectangle second = whole;
    if ((whole.columns - 1) * pixelStep_ >= (whole.rows - 1) * rowStep_) {
      first.columns /= 2;
      second.x += first.columns;
      second.columns -= first.columns;
    } else {
      first.rows /= 2;
      second.y += first.rows;
      second.rows -= first.rows;
    }
    return SplitIntoReads(first, read) && SplitIntoReads(second, read);
  }

  bool ReadTile(const Rectangle& tile) {
    const auto read = [&](const Rectangle& part) {
      const std::byte* const first = ReadSpan(part);
      if (first == nullptr) return false;
      const std::int64_t place = std::int64_t{part.y - tile.y} * tile.columns + part.x - tile.x;
      std::byte* target = &tile_[static_cast<std::size_t>(place * pixelBytes_)];
      for (std::int32_t row = 0; row < part.rows; ++row, target += tile.columns * pixelBytes_) {
        CopyPixels(first + row * layout_.rowStride, part.columns, target);
      }
      return true;
    };
    if (!SplitIntoReads(tile, read)) return false;
    renderer_.Add(
        {tile.x, tile.y, {tile.columns, tile.rows, tile_.get(), pixelBytes_, tile.columns * pixelBytes_}});
    return true;
  }

  /// Copies pixels of a row without the gaps between them.
  void CopyPixels(const std::byte* source, std::int32_t count, std::byte* target) const {
    switch (pixelBytes_) {
      case 1: CopyPixelsOf<1>(source, count, target); break;
      case 2: CopyPixelsOf<2>(source, count, target); break;
      case 3: CopyPixelsOf<3>(source, count, target); break;
      case 4: CopyPixelsOf<4>(source, count, target); break;
      case 8: CopyPixelsOf<8>(source, count, target); break;
      case 16: CopyPixelsOf<16>(source, count, target); break;
      default: break;
    }
  }

  template <std::int64_t kBytes>
  void CopyPixelsOf(const std::byte* source, std::int32_t count, std::byte* target) const {
    for (std::int64_t i = 0; i < count; ++i) {
      std::memcpy(target + i * kBytes, source + i * layout_.pixelStride, kBytes);
    }
  }

  /// Reads a rectangle of pixels at once and passes it on.
  bool ReadPiece(const Rectangle& piece) {
    const std::byte* const first = ReadSpan(piece);
    if (first == nullptr) return false;
    renderer_.Add(
        {piece.x, piece.y, {piece.columns, piece.rows, first, layout_.pixelStride, layout_.rowStride}});
    return true;
  }

  /// Reads all bytes between the first and the last pixel of a rectangle into the buffer. Returns the top
  /// left pixel, or null if the read fails.
  const std::byte* ReadSpan(const Rectangle& pixels) {
    const std::int64_t right = (pixels.columns - std::int64_t{1}) * layout_.pixelStride;
    const std::int64_t down = (pixels.rows - std::int64_t{1}) * layout_.rowStride;
    const std::int64_t before = -(std::min<std::int64_t>(right, 0) + std::min<std::int64_t>(down, 0));
    if (!ReadBytes(PixelPosition(pixels.x, pixels.y) - before, Span(pixels.columns, pixels.rows)))
      return nullptr;
    return &buffer_[static_cast<std::size_t>(before)];
  }

  std::int64_t PixelPosition(std::int32_t x, std::int32_t y) const {
    return layout_.blockPosition + layout_.firstPixel + x * layout_.pixelStride + y * layout_.rowStride;
  }

  /// Reads `count` bytes from file offset `position` into the buffer.
  bool ReadBytes(std::int64_t position, std::int64_t count) {
    if (position != position_) stream_.seekg(position);
    stream_.read(reinterpret_cast<char*>(buffer_.get()), count);
    position_ = position + count;
    if (layout_.swapBytes) {
      for (std::size_t i = 0; i + 1 < static_cast<std::size_t>(count); i += 2)
        std::swap(buffer_[i], buffer_[i + 1]);
    }
    return stream_.good();
  }

  std::istream& stream_;
  const FrameLayout& layout_;
  FrameRenderer& renderer_;
  std::int32_t factor_;
  std::int32_t width_;  // of all whole blocks
  std::int32_t height_;
  std::int64_t pixelBytes_;
  std::int64_t pixelStep_;
  std::int64_t rowStep_;
  std::int64_t bufferBytes_ = 0;
  std::unique_ptr<std::byte[]> buffer_;
  std::unique_ptr<std::byte[]> tile_;  // the pixels of a tile, without gaps
  std::int64_t position_ = -1;         // of the stream; -1 if unknown
};

}  // namespace

bool IsReadable(const FrameLayout& layout) {
  const std::int64_t pixels = std::int64_t{layout.size.width} * layout.size.height;
  if (pixels - layout.blockBytes > kMaxSharedPixels) return false;
  const std::int64_t right = (layout.size.width - std::int64_t{1}) * layout.pixelStride;
  const std::int64_t down = (layout.size.height - std::int64_t{1}) * layout.rowStride;
  const std::int64_t first =
      layout.firstPixel + std::min<std::int64_t>(right, 0) + std::min<std::int64_t>(down, 0);
  const std::int64_t last =
      layout.firstPixel + std::max<std::int64_t>(right, 0) + std::max<std::int64_t>(down, 0);
  return layout.blockPosition >= 0 && first >= 0 && last + layout.type.bytes() <= layout.blockBytes;
}

HBITMAP ReadThumbnail(std::istream& stream, const FrameLayout& layout, const SIZE& request) {
  if (layout.size.width < 1 || layout.size.height < 1) return nullptr;
  if (!IsReadable(layout)) stream.setstate(std::ios_base::failbit);
  if (stream.fail() || !HoldsBlock(stream, layout)) return nullptr;
  const auto renderer = MakeFrameRenderer(layout.type.tag, layout.size, request);
  if (renderer == nullptr) return nullptr;
  const bool hasBlocks = renderer->reduction().HasBlocks();
  if (hasBlocks && !BandReader(stream, layout, *renderer).ReadFrame()) {
    stream.setstate(std::ios_base::failbit);
    return nullptr;
  }
  return renderer->Finish();
}

}  // namespace Qel::Lumetra::ShellExt
