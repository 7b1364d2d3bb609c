// A small collection of files of every supported kind and pixel type, with pictures like a microscope's, and
// a few files that cannot be shown. The bytes are the same in every run and on every machine.
#pragma once

#include <string>
#include <vector>

namespace Qel::Lumetra::ShellExt::Samples {

struct Sample {
  const char* name;       // the file name
  std::string (*make)();  // returns the bytes
};

const std::vector<Sample>& AllSamples();

}  // namespace Qel::Lumetra::ShellExt::Samples
