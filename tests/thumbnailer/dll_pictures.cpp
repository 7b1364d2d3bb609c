// Writes the bitmaps that the built DLL makes. Each line of standard input is a request: the edge, the file,
// and the path of the output, separated by tabs. The output is one line with the width, the height and the
// bits per pixel, then the rows without padding.
#include <windows.h>

#include <objidl.h>
#include <shlobj.h>

#include <filesystem>
#include <fstream>
#include <iostream>
#include <sstream>
#include <string>

#include "bitmap_pixels.h"
#include "server_dll.h"

namespace {

using namespace Qel::Lumetra::ShellExt::Testing;

BitmapPixels MakePicture(const ServerDll& server, const std::wstring& path, LONG edge) {
  const auto file = server.CreateInstance<IPersistFile>(kShellExtClass, IID_IPersistFile);
  file->Load(path.c_str(), STGM_READ);
  const auto extractor = As<IExtractImage>(file, IID_IExtractImage);
  const SIZE size{edge, edge};
  wchar_t location[MAX_PATH] = {};
  DWORD priority = 0;
  DWORD flags = 0;
  extractor->GetLocation(location, MAX_PATH, &priority, &size, 24, &flags);
  HBITMAP bitmap = nullptr;
  extractor->Extract(&bitmap);
  return TakeBitmap(bitmap);
}

}  // namespace

int main() {
  const ServerDll server;
  std::string line;
  while (std::getline(std::cin, line)) {
    std::istringstream words(line);
    std::string edge;
    std::string file;
    std::string out;
    std::getline(std::getline(std::getline(words, edge, '\t'), file, '\t'), out, '\t');
    const BitmapPixels picture = MakePicture(server, std::filesystem::path(file).wstring(), std::stoi(edge));
    std::ofstream bitmap(out, std::ios_base::binary);
    bitmap << picture.width << ' ' << picture.height << ' ' << picture.bits << '\n';
    bitmap.write(reinterpret_cast<const char*>(picture.bytes.data()),
                 static_cast<std::streamsize>(picture.bytes.size()));
    if (!bitmap.flush()) return 1;
  }
}
