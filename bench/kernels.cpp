// Benchmarks of the reduction alone. Bands of a frame that stay in the processor's cache are added to a
// renderer repeatedly, in the shapes that the frame reader produces. The logarithms of complex frames, the
// costliest part, have a benchmark of their own.
#include <benchmark/benchmark.h>

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <cstring>
#include <random>
#include <string>
#include <vector>

#include "data_type.h"
#include "frame_renderer.h"
#include "logarithm.h"

namespace Qel::Lumetra::ShellExt::Bench {
namespace {

constexpr std::int64_t kBandBytes = 256LL * 1024;

template <class T>
void Fill(std::vector<std::byte>& band) {
  std::mt19937 engine(1);
  std::normal_distribution<double> values(100, 20);
  for (std::size_t i = 0; i + sizeof(T) <= band.size(); i += sizeof(T)) {
    const T value = static_cast<T>(values(engine));
    std::memcpy(&band[i], &value, sizeof(T));
  }
}

void FillBand(DataType type, std::vector<std::byte>& band) {
  switch (type) {
    case DataType::kFloat32:
    case DataType::kComplexFloat32: Fill<float>(band); break;
    case DataType::kFloat64:
    case DataType::kComplexFloat64: Fill<double>(band); break;
    default: Fill<std::uint8_t>(band);  // for integers the values make no difference
  }
}

void Kernel(benchmark::State& state, DataType type, Size2 frame) {
  const auto edge = static_cast<LONG>(state.range(0));
  const auto renderer = MakeFrameRenderer(PixelTypeOf(type).tag, frame, SIZE{edge, edge});
  const std::int32_t factor = renderer->reduction().factor;
  const std::int32_t width = renderer->reduction().size.width * factor;
  const std::int32_t height = renderer->reduction().size.height * factor;
  const std::int64_t rowBytes = std::int64_t{frame.width} * PixelTypeOf(type).bytes();
  // Adds whole rows of blocks if they fit into the band; otherwise the rows of one row of blocks in parts.
  const auto fitting = static_cast<std::int32_t>(kBandBytes / rowBytes);
  const std::int32_t bandRows = std::max(fitting / factor, 1) * factor;
  std::vector<std::byte> band(static_cast<std::size_t>(fitting * rowBytes));
  FillBand(type, band);

  for (auto iteration : state) {
    for (std::int32_t top = 0; top < height; top += bandRows) {
      const std::int32_t end = std::min(top + bandRows, height);
      for (std::int32_t y = top; y < end;) {
        const std::int32_t rows = std::min(fitting, end - y);
        renderer->Add({0, y, {width, rows, band.data(), PixelTypeOf(type).bytes(), rowBytes}});
        y += rows;
      }
    }
    benchmark::ClobberMemory();
  }
  state.SetItemsProcessed(state.iterations() * width * height);
}

void Logarithms(benchmark::State& state, decltype(LogarithmsToFloat) body) {
  std::vector<double> values(4096);
  std::mt19937 engine(1);
  std::chi_squared_distribution<double> squaredMagnitudes(2);
  for (double& value : values) value = squaredMagnitudes(engine);
  std::vector<float> logarithms(values.size());
  for (auto iteration : state) {
    body(values.data(), values.size(), logarithms.data());
    benchmark::ClobberMemory();
  }
  state.SetItemsProcessed(state.iterations() * static_cast<std::int64_t>(values.size()));
}

void Register(const char* name, DataType type, Size2 frame) {
  auto* const kernel =
      benchmark::RegisterBenchmark(name, [=](benchmark::State& state) { Kernel(state, type, frame); });
  for (const int edge : {96, 256, 1024}) kernel->Arg(edge);
}

}  // namespace
}  // namespace Qel::Lumetra::ShellExt::Bench

int main(int argc, char** argv) {
  using namespace Qel::Lumetra::ShellExt;
  Bench::Register("uint8", DataType::kUInt8, {8192, 8192});
  Bench::Register("int16", DataType::kInt16, {4096, 4096});
  Bench::Register("uint16", DataType::kUInt16, {4096, 4096});
  Bench::Register("uint16 5760x4092", DataType::kUInt16, {5760, 4092});
  Bench::Register("rgb", DataType::kRgb24, {4096, 4096});
  Bench::Register("int32", DataType::kInt32, {4096, 4096});
  Bench::Register("float32", DataType::kFloat32, {4096, 4096});
  Bench::Register("float64", DataType::kFloat64, {4096, 4096});
  Bench::Register("complex64", DataType::kComplexFloat32, {4096, 4096});
  Bench::Register("complex128", DataType::kComplexFloat64, {2048, 2048});
  benchmark::RegisterBenchmark("logarithms/SSE2", Bench::Logarithms, LogarithmsToFloatBaseline);
  if (HasAvx2()) benchmark::RegisterBenchmark("logarithms/AVX2", Bench::Logarithms, LogarithmsToFloatAvx2);
  benchmark::Initialize(&argc, argv);
  if (benchmark::ReportUnrecognizedArguments(argc, argv)) return 1;
  benchmark::RunSpecifiedBenchmarks();
}
