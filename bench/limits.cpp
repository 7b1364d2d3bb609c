// How long the readers take at the most for files that anybody can make, of up to 64 KiB: damaged samples,
// files made to keep a reader busy, and the files of the folders that are named (what the fuzzers have found,
// say). Prints the slowest of each kind. Times are here and not in a test, because they are the machine's
// too.
//
//   bench_limits [CORPUS]
//
// CORPUS has a folder of files for each kind.
#include <algorithm>
#include <chrono>
#include <cstdio>
#include <filesystem>
#include <fstream>
#include <istream>
#include <iterator>
#include <string>
#include <vector>

#include "ask_everything.h"
#include "damage.h"
#include "emi_file.h"
#include "file_type_factory.h"
#include "memory_buffer.h"
#include "mrc_file.h"
#include "raw_file.h"
#include "sample_files.h"
#include "ser_file.h"

namespace {

using namespace Qel::Lumetra::ShellExt;
using namespace Qel::Lumetra::ShellExt::Testing;
using Clock = std::chrono::steady_clock;

constexpr std::size_t kMostBytes = 65536;

double Milliseconds(Clock::duration duration) {
  return std::chrono::duration<double, std::milli>(duration).count();
}

struct Slowest {
  double milliseconds = 0;
  std::string name;

  void Include(double time, const std::string& candidate) {
    if (time > milliseconds) *this = {time, candidate};
  }
};

/// What the files of one kind take.
struct Limits {
  std::wstring extension;
  int files = 0;
  Slowest refusal;    // to the first answer, which is no
  Slowest questions;  // all of them, of an acceptable file, with eight thumbnails

  void Measure(const std::string& name, const std::string& bytes) {
    ++files;
    double least = 1e9;
    Answers answers;
    // The machine's own pauses are not the reader's: the best of three.
    for (int round = 0; round < 3; ++round) {
      MemoryBuffer buffer(bytes);
      std::istream stream(&buffer);
      const auto start = Clock::now();
      answers = AskEverything(stream, extension);
      least = std::min(least, Milliseconds(Clock::now() - start));
    }
    (answers.valid ? questions : refusal).Include(least, name);
  }
};

/// As many pixels as bytes do not forbid, of which a file of 64 KiB has the most work.
void MeasureBusyFiles(const std::string& kind, Limits& limits) {
  const std::string pixels(kMostBytes - 1100, '\3');
  if (kind == "mrc") {
    for (const std::int32_t mode : {0, 1, 2, 3, 4, 6, 16}) {
      const std::int32_t pixelBytes = mode == 4 ? 8 : mode == 0 ? 1 : mode == 16 ? 3 : mode % 4 == 2 ? 4 : 2;
      const auto count = static_cast<std::int32_t>(pixels.size()) / std::max(pixelBytes, 4);
      for (const std::int32_t height : {1, 128, count}) {
        MrcFile file;
        file.nx = count / height;
        file.ny = height;
        file.mode = mode;
        file.pixels = pixels;
        limits.Measure("busy", file.Bytes());
      }
    }
  } else if (kind == "raw") {
    for (const DataType type : {DataType::kUInt8, DataType::kInt32, DataType::kFloat64,
                                DataType::kComplexFloat64, DataType::kRgb24}) {
      for (const std::int32_t width : {1, 16, 256, 4096, 65536}) {
        for (const std::int32_t pixelStride : {0, 1, 3, 16, 255, 257, 1000, 8191}) {
          for (const std::int32_t rowStride : {0, 1, 3, 16, 255, 257, 1000, 8191}) {
            RawFile file = PackedRawFile(type, width, 65536 / width, pixels);
            file.pixelStride = pixelStride;
            file.rowStride = rowStride;
            limits.Measure("strides " + std::to_string(pixelStride) + " and " + std::to_string(rowStride),
                           file.Bytes());
          }
        }
      }
    }
  } else if (kind == "ser") {
    SerFile file;
    file.elements.resize(1);
    file.elements[0].pixels = "p";
    const std::string one = file.Bytes();
    // All elements are the one that there is.
    const auto count = static_cast<std::uint32_t>((kMostBytes - one.size()) / 8);
    file.validElements = file.totalElements = count;
    std::string offsets;
    const std::string alone = one.substr(one.size() - 8, 4);
    for (std::uint32_t i = 0; i < 2 * count; ++i) offsets += alone;
    file.offsetArrays = offsets;
    limits.Measure("one element many times", file.Bytes());
    SerFile wide;
    wide.dimensions.resize(kMostBytes / 44);
    wide.elements.resize(1);
    limits.Measure("many dimensions", wide.Bytes());
  } else if (kind == "emi") {
    std::string nested;
    std::string images;
    while (nested.size() < kMostBytes - 16) nested += EmiOpening(0x49B0, 0x0610);
    const std::string image = EmiImageObject(EmiPixelArray(0x2202, 1, 1, "p"));
    while (images.size() < kMostBytes - 100) images += image;
    limits.Measure("nested images", EmiFile{.items = nested}.Bytes());
    limits.Measure("many images", EmiFile{.items = images}.Bytes());
  }
}

void MeasureDamagedSamples(const std::string& kind, Limits& limits) {
  for (const SampleFile& sample : SampleFiles(kind)) {
    for (std::size_t length = 0; length <= sample.bytes.size(); ++length) {
      limits.Measure(sample.name + " cut to " + std::to_string(length), sample.bytes.substr(0, length));
    }
    for (std::size_t offset = 0; offset + 4 <= std::min<std::size_t>(sample.bytes.size(), 96); ++offset) {
      for (const std::uint32_t value : kBoundaryValues) {
        // Pixels that the file does not have keep a reader no longer than those of 64 KiB.
        std::string bytes = sample.bytes;
        PutField(bytes, offset, value);
        bytes.resize(kMostBytes, '\3');
        limits.Measure(sample.name + " with " + std::to_string(value) + " at " + std::to_string(offset),
                       bytes);
      }
    }
  }
}

void MeasureFolder(const std::filesystem::path& folder, Limits& limits) {
  for (const auto& entry : std::filesystem::directory_iterator(folder)) {
    std::ifstream file(entry.path(), std::ios_base::binary);
    const std::string bytes{std::istreambuf_iterator<char>(file), std::istreambuf_iterator<char>()};
    limits.Measure(entry.path().filename().string(), bytes);
  }
}

}  // namespace

int main(int argc, char** argv) {
  std::printf("kind    files  refused after    all done after\n");
  for (const std::string kind : kFileKinds) {
    Limits limits{{kind.begin(), kind.end()}, 0, {}, {}};
    MeasureDamagedSamples(kind, limits);
    MeasureBusyFiles(kind, limits);
    if (argc > 1) MeasureFolder(std::filesystem::path(argv[1]) / kind, limits);
    std::printf("%-4s %8d %8.3f ms %12.3f ms  (%s; %s)\n", kind.c_str(), limits.files,
                limits.refusal.milliseconds, limits.questions.milliseconds, limits.refusal.name.c_str(),
                limits.questions.name.c_str());
  }
}
