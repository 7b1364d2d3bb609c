// A process that measures on command, so that the driving program can alternate its rounds with those of
// other processes.
//
// A command is one line on standard input, with words separated by tabs. The reply is one line on standard
// output: a time in nanoseconds, or "error", a tab and the reason. Files are named relative to the working
// directory.
//
//   thumbnail EDGE FILE             opens FILE and makes its thumbnail
//   read POSITION COUNT FILE        reads COUNT bytes through std::ifstream
//   blocks FIRST DISTANCE COUNT BYTES FILE   reads COUNT blocks of BYTES bytes (subject.h)
//   metadata VIEW FILE...           opens each file and requests what VIEW shows of it (subject.h)
//   starts BYTES FILE...            opens each file and reads its first BYTES bytes
#include <windows.h>

#include <chrono>
#include <exception>
#include <filesystem>
#include <fstream>
#include <iostream>
#include <map>
#include <sstream>
#include <stdexcept>
#include <string>
#include <vector>

#include "path_stream.h"
#include "subject.h"

namespace Qel::Lumetra::ShellExt::Bench {
namespace {

using Words = std::vector<std::string>;

std::wstring Path(const std::string& name) {
  return std::filesystem::path(name).wstring();
}

/// Returns the nanoseconds that `work` takes. Throws std::runtime_error if it returns false.
template <class Work>
std::string TimeOf(const Work& work) {
  using Clock = std::chrono::steady_clock;
  const Clock::time_point begin = Clock::now();
  const bool done = work();
  const Clock::duration time = Clock::now() - begin;
  if (!done) throw std::runtime_error("no result");
  return std::to_string(std::chrono::duration_cast<std::chrono::nanoseconds>(time).count());
}

/// Returns the nanoseconds that `work` takes for the files from the third word on.
template <class Work>
std::string TimeOfFiles(const Words& words, const Work& work) {
  std::vector<std::wstring> paths;
  for (std::size_t i = 2; i < words.size(); ++i) paths.push_back(Path(words[i]));
  return TimeOf([&] {
    bool done = true;
    for (const std::wstring& path : paths) done = work(path) && done;
    return done;
  });
}

std::string TimeThumbnail(const Words& words) {
  const LONG edge = std::stoi(words.at(1));
  const std::wstring path = Path(words.at(2));
  HBITMAP bitmap = nullptr;
  std::string time = TimeOf([&] {
    bitmap = MakeThumbnail(path, {edge, edge});
    return bitmap != nullptr;
  });
  DeleteObject(bitmap);
  return time;
}

std::string TimeRead(const Words& words) {
  static constexpr std::streamsize kBufferBytes = 256LL * 1024;
  // The address of the buffer within a page changes the time by up to a sixth. This is where malloc places
  // it.
  alignas(4096) static char pages[16 + kBufferBytes];
  char* const buffer = pages + 16;
  const std::int64_t position = std::stoll(words.at(1));
  std::int64_t left = std::stoll(words.at(2));
  const std::wstring path = Path(words.at(3));
  return TimeOf([&] {
    std::ifstream stream;
    OpenPath(stream, path.c_str());
    stream.seekg(position);
    while (left > 0 && stream.read(buffer, std::min<std::int64_t>(left, kBufferBytes))) {
      left -= stream.gcount();
    }
    return left == 0;
  });
}

std::string TimeBlocks(const Words& words) {
  const Blocks blocks{std::stoll(words.at(1)), std::stoll(words.at(2)), std::stoll(words.at(3)),
                      static_cast<std::size_t>(std::stoll(words.at(4)))};
  const std::wstring path = Path(words.at(5));
  return TimeOf([&] { return ReadBlocks(path, blocks); });
}

std::string TimeMetadata(const Words& words) {
  return TimeOfFiles(words, [&](const std::wstring& path) { return ReadMetadata(words.at(1), path); });
}

std::string TimeStarts(const Words& words) {
  std::vector<char> start(static_cast<std::size_t>(std::stoi(words.at(1))));
  return TimeOfFiles(words, [&](const std::wstring& path) {
    std::ifstream stream;
    OpenPath(stream, path.c_str());
    return stream.read(start.data(), static_cast<std::streamsize>(start.size())).good();
  });
}

std::string Answer(const std::string& line) {
  static const std::map<std::string, std::string (*)(const Words&)> kCommands = {
      {"thumbnail", TimeThumbnail}, {"read", TimeRead},     {"blocks", TimeBlocks},
      {"metadata", TimeMetadata},   {"starts", TimeStarts},
  };
  Words words;
  std::istringstream stream(line);
  for (std::string word; std::getline(stream, word, '\t');) words.push_back(word);
  return kCommands.at(words.at(0))(words);
}

void Serve() {
  for (std::string line; std::getline(std::cin, line);) {
    if (!line.empty() && line.back() == '\r') line.pop_back();
    try {
      std::cout << Answer(line) << '\n' << std::flush;
    } catch (const std::exception& error) {
      std::cout << "error\t" << error.what() << '\n' << std::flush;
    }
  }
}

}  // namespace
}  // namespace Qel::Lumetra::ShellExt::Bench

int main() {
  Qel::Lumetra::ShellExt::Bench::Serve();
}
