// A process that measures on command, so that whoever drives it can interleave its rounds with those of other
// programs and can look at its memory in between.
//
// One command a line on standard input, words separated by tabs, answered by one line on standard output: a
// time in nanoseconds, or "ok". A command that cannot be carried out is answered by "error" and the reason.
// Files are named relative to the folder in which the process was started.
//
//   thumbnail CX FILE             the whole way from the file to the bitmap
//   read POSITION COUNT FILE      the bare read of these bytes
//   open FILE                     making the reader
//   headers FIRST STEP COUNT BYTES FILE   one positioned read of BYTES bytes at each of COUNT places
//   metadata WHAT FILE...         what the shell shows of each file beside the picture (subject.h)
//   starts BYTES FILE...          opening each file and reading its first BYTES bytes
//   bitmap CX FILE OUT            writes the bitmap's bytes to OUT
//   naive CX FORMAT WIDTH HEIGHT FIRST PIXELSTRIDE ROWSTRIDE FILE OUT   the same of the naive reference
#include <windows.h>

#include <chrono>
#include <exception>
#include <filesystem>
#include <fstream>
#include <iostream>
#include <map>
#include <memory>
#include <sstream>
#include <stdexcept>
#include <string>
#include <vector>

#include "bitmap_pixels.h"
#include "naive_picture.h"
#include "path_stream.h"
#include "positioned_reads.h"
#include "subject.h"

namespace Qel::Lumetra::ShellExt::Bench {
namespace {

using Words = std::vector<std::string>;

void Require(bool done, const std::string& what) {
  if (!done) throw std::runtime_error(what);
}

std::wstring Path(const std::string& name) {
  return std::filesystem::path(name).wstring();
}

template <class Work>
std::string TimeOf(const Work& work) {
  using Clock = std::chrono::steady_clock;
  const Clock::time_point begin = Clock::now();
  work();
  return std::to_string(std::chrono::duration_cast<std::chrono::nanoseconds>(Clock::now() - begin).count());
}

SIZE Request(const std::string& word) {
  const LONG edge = std::stoi(word);
  return {edge, edge};
}

std::string TimeThumbnail(const Words& words) {
  const std::wstring path = Path(words.at(2));
  HBITMAP bitmap = nullptr;
  std::string time = TimeOf([&] { bitmap = MakeThumbnail(path, Request(words.at(1))); });
  Require(bitmap != nullptr && DeleteObject(bitmap), "no thumbnail of " + words.at(2));
  return time;
}

std::string TimeRead(const Words& words) {
  static constexpr std::streamsize kBufferBytes = 256LL * 1024;
  static const auto buffer = std::make_unique<char[]>(kBufferBytes);
  const std::wstring path = Path(words.at(3));
  const std::int64_t position = std::stoll(words.at(1));
  std::int64_t left = std::stoll(words.at(2));
  std::string time = TimeOf([&] {
    std::ifstream stream;
    OpenPath(stream, path.c_str());
    stream.seekg(position);
    while (left > 0 && stream.read(buffer.get(), std::min<std::int64_t>(left, kBufferBytes))) {
      left -= stream.gcount();
    }
  });
  Require(left == 0, "cannot read " + words.at(3));
  return time;
}

std::string TimeOpen(const Words& words) {
  const std::wstring path = Path(words.at(1));
  bool valid = false;
  std::string time = TimeOf([&] { valid = OpenFile(path); });
  Require(valid, words.at(1) + " is not valid");
  return time;
}

std::string TimeHeaders(const Words& words) {
  const std::wstring path = Path(words.at(5));
  const PositionedReads reads{std::stoll(words.at(1)), std::stoll(words.at(2)), std::stoll(words.at(3)),
                              static_cast<std::size_t>(std::stoll(words.at(4)))};
  bool done = false;
  std::string time = TimeOf([&] { done = ReadAtPositions(path, reads); });
  Require(done, "cannot read " + words.at(5));
  return time;
}

/// The time that `work`, which answers whether it could be done, takes for the files from word 2 on.
template <class Work>
std::string TimeForFiles(const Words& words, const Work& work) {
  std::vector<std::wstring> paths;
  for (std::size_t i = 2; i < words.size(); ++i) paths.push_back(Path(words[i]));
  bool done = true;
  std::string time = TimeOf([&] {
    for (const std::wstring& path : paths) done = work(path) && done;
  });
  Require(done, words.front() + " of a file failed");
  return time;
}

std::string TimeMetadata(const Words& words) {
  return TimeForFiles(words, [&](const std::wstring& path) { return ReadMetadata(words.at(1), path); });
}

std::string TimeStarts(const Words& words) {
  std::vector<char> start(static_cast<std::size_t>(std::stoi(words.at(1))));
  return TimeForFiles(words, [&](const std::wstring& path) {
    std::ifstream stream;
    OpenPath(stream, path.c_str());
    return stream.read(start.data(), static_cast<std::streamsize>(start.size())).good();
  });
}

std::string WritePicture(const Testing::BitmapPixels& picture, const std::string& file) {
  Require(!picture.bytes.empty(), "no picture for " + file);
  std::ofstream out(file, std::ios_base::binary);
  out << picture.width << ' ' << picture.height << ' ' << picture.bits << '\n';
  out.write(reinterpret_cast<const char*>(picture.bytes.data()),
            static_cast<std::streamsize>(picture.bytes.size()));
  Require(out.flush().good(), "cannot write " + file);
  return "ok";
}

std::string WriteBitmap(const Words& words) {
  return WritePicture(Testing::TakeBitmap(MakeThumbnail(Path(words.at(2)), Request(words.at(1)))),
                      words.at(3));
}

std::string WriteNaive(const Words& words) {
  const PixelPlaces places{words.at(2),
                           {std::stoi(words.at(3)), std::stoi(words.at(4))},
                           std::stoll(words.at(5)),
                           std::stoll(words.at(6)),
                           std::stoll(words.at(7))};
  return WritePicture(NaivePicture(Path(words.at(8)), places, Request(words.at(1))), words.at(9));
}

std::string Answer(const std::string& line) {
  static const std::map<std::string, std::string (*)(const Words&)> kCommands = {
      {"thumbnail", TimeThumbnail}, {"read", TimeRead},     {"open", TimeOpen},      {"headers", TimeHeaders},
      {"metadata", TimeMetadata},   {"starts", TimeStarts}, {"bitmap", WriteBitmap}, {"naive", WriteNaive},
  };
  Words words;
  std::istringstream stream(line);
  for (std::string word; std::getline(stream, word, '\t');) words.push_back(word);
  const auto command = kCommands.find(words.empty() ? "" : words.front());
  Require(command != kCommands.end(), "unknown command");
  return command->second(words);
}

void Serve() {
  for (std::string line; std::getline(std::cin, line);) {
    if (!line.empty() && line.back() == '\r') line.pop_back();
    try {
      std::cout << Answer(line) << std::endl;
    } catch (const std::exception& error) {
      std::cout << "error\t" << error.what() << std::endl;
    }
  }
}

}  // namespace
}  // namespace Qel::Lumetra::ShellExt::Bench

int main() {
  Qel::Lumetra::ShellExt::Bench::Serve();
}
