// qelthumb, the program that Linux file managers run for each file with a thumbnail. qelthumb.thumbnailer
// gives them its command line. They read the PNG file that it writes.
#include <png.h>
#include <sys/resource.h>
#include <unistd.h>
#include <windows.h>

#include <algorithm>
#include <cerrno>
#include <charconv>
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <memory>
#include <new>
#include <stdexcept>
#include <string>
#include <string_view>
#include <system_error>

#include "fault_text.h"
#include "file_type_factory.h"

namespace Qel::Lumetra::ShellExt {
namespace {

namespace fs = std::filesystem;

constexpr int kWrongUsage = 2;

constexpr std::int32_t kMaxSize = 4096;
constexpr rlim_t kMaxMemory = rlim_t{512} << 20;  // four times the memory for a picture of kMaxSize
constexpr rlim_t kMaxSeconds = 30;

/// A failure whose text is a sentence for the user.
using Failure = std::runtime_error;

using Bitmap = std::unique_ptr<HBITMAP__, decltype([](HBITMAP bitmap) { DeleteObject(bitmap); })>;

/// Returns the reason why the last system call failed, as the end of a sentence.
std::string Reason() {
  return ": " + std::generic_category().message(errno) + ".";
}

/// Lowers a limit of this process to `value`, unless it is lower already.
void Limit(int resource, rlim_t value) {
  rlimit limit{};
  getrlimit(resource, &limit);
  limit.rlim_cur = limit.rlim_max = std::min(limit.rlim_cur, value);
  setrlimit(resource, &limit);
}

/// Returns the size in pixels, or 0 if `text` is not a number from 1 to kMaxSize.
std::int32_t ParseSize(std::string_view text) {
  std::int32_t size = 0;
  const auto [end, error] = std::from_chars(text.data(), text.data() + text.size(), size);
  return error == std::errc() && end == text.data() + text.size() && size <= kMaxSize ? std::max(size, 0) : 0;
}

/// Returns the edge in pixels to request for a thumbnail no larger than `size`. It is never larger than the
/// frame, because such a request for a colour frame would crash the process.
std::int32_t EdgeFor(Size2 frame, std::int32_t size) {
  const std::int64_t longest = std::max({frame.width, frame.height, 1});
  return static_cast<std::int32_t>(longest / ((longest + size - 1) / size));
}

Bitmap MakeThumbnail(const fs::path& path, std::int32_t size) {
  std::error_code error;
  // Opening a pipe would wait for its writer.
  if (!fs::is_regular_file(path, error) && !error) throw Failure("This is a folder or a device, not a file.");
  std::ifstream stream(path, std::ios_base::binary);
  if (!stream) throw Failure("The file cannot be opened" + Reason());
  // The known extensions are ASCII, which is the same in every character set.
  const std::wstring extension = GetExtension({path.native().begin(), path.native().end()});
  const auto text = ExplainFault(stream, extension);
  if (!text) throw Failure("Only " QEL_EXTENSIONS " files are supported.");
  if (!text->fault.empty()) throw Failure(text->fault + " " + text->advice);

  stream.clear();
  stream.seekg(0);
  const auto reader = CreateFileTypeInfo(stream, extension);
  const std::int32_t edge = EdgeFor(reader->GetDimensions(), size);
  Bitmap bitmap(reader->CreateThumbnail({edge, edge}));
  if (!bitmap)
    throw Failure("The image is too narrow to be reduced to " + std::to_string(edge) +
                  " pixels. Request a larger size.");
  return bitmap;
}

/// Writes a temporary file in the folder of `path` and renames it, so that no program sees an incomplete
/// picture. An existing empty file is overwritten instead: its creator, such as tumblerd, may have it open
/// and would otherwise keep reading the old one.
void WritePng(const Bitmap& bitmap, const std::string& path) {
  BITMAP pixels{};
  GetObjectW(bitmap.get(), sizeof pixels, &pixels);
  png_image image{};
  image.version = PNG_IMAGE_VERSION;
  image.width = static_cast<png_uint_32>(pixels.bmWidth);
  image.height = static_cast<png_uint_32>(pixels.bmHeight);
  image.format = pixels.bmBitsPixel == 8 ? PNG_FORMAT_GRAY : PNG_FORMAT_BGR;

  std::error_code error;
  const bool isEmpty = fs::is_regular_file(path, error) && fs::file_size(path, error) == 0;
  std::string written = isEmpty ? path : path + ".XXXXXX";
  if (!isEmpty) {
    const int descriptor = mkstemp(written.data());
    if (descriptor == -1) throw Failure(path + " cannot be written" + Reason());
    close(descriptor);
  }
  if (png_image_write_to_file(&image, written.c_str(), 0, pixels.bmBits, pixels.bmWidthBytes, nullptr) == 0) {
    throw Failure(path + " cannot be written: " + image.message + ".");
  }
  if (std::rename(written.c_str(), path.c_str()) != 0) {
    const std::string reason = Reason();
    unlink(written.c_str());
    throw Failure(path + " cannot be written" + reason);
  }
}

}  // namespace
}  // namespace Qel::Lumetra::ShellExt

int main(int count, char** arguments) {
  using namespace Qel::Lumetra::ShellExt;
  const std::int32_t size = count == 4 ? ParseSize(arguments[1]) : 0;
  if (size == 0) {
    std::fputs(
        "usage: qelthumb SIZE INPUT OUTPUT.png\n\n"
        "Writes a thumbnail of INPUT with at most SIZE pixels in each direction, from 1 to 4096.\n",
        stderr);
    return kWrongUsage;
  }
  const char* const input = arguments[2];
  const char* const output = arguments[3];
  if (std::error_code error; fs::equivalent(input, output, error)) {
    std::fprintf(stderr, "%s: This is also the output file. Name another output file.\n", input);
    return kWrongUsage;
  }
  // Some file managers do not limit the memory and time of thumbnailers.
  Limit(RLIMIT_AS, kMaxMemory);
  Limit(RLIMIT_CPU, kMaxSeconds);
  try {
    WritePng(MakeThumbnail(input, size), output);
    return EXIT_SUCCESS;
  } catch (const std::bad_alloc&) {
    std::fprintf(stderr, "%s: The thumbnail needs more memory than qelthumb may use.\n", input);
  } catch (const std::exception& e) {
    std::fprintf(stderr, "%s: %s\n", input, e.what());
  }
  return EXIT_FAILURE;
}
