#include "page_writer.h"

#include <filesystem>

#include "console.h"
#include "failure.h"
#include "page_resource.h"
#include "reports.h"
#include "text_tools.h"

namespace Qel::Lumetra::ShellExt::Show {
namespace {

/// Where the JSON document stands in the template.
constexpr std::string_view kPlaceOfFiles = "@FILES@";

constexpr const wchar_t* kPicturesFolder = L"pictures";

/// `error` is a code of the system or of the standard library.
template <class Error>
[[noreturn]] void CannotWrite(const std::wstring& path, const Error& error) {
  throw Failure(L"\"" + path + L"\" cannot be written: " + SystemErrorText(error) + L".");
}

std::string_view Template() {
  const HRSRC resource =
      FindResourceW(nullptr, MAKEINTRESOURCEW(IDR_PAGE), MAKEINTRESOURCEW(10));  // RT_RCDATA
  const HGLOBAL handle = LoadResource(nullptr, resource);
  return {static_cast<const char*>(LockResource(handle)), SizeofResource(nullptr, resource)};
}

OwnedHandle CreateFileAt(const std::wstring& path) {
  const HANDLE file = CreateFileW(path.c_str(), GENERIC_WRITE, FILE_SHARE_READ, nullptr, CREATE_ALWAYS,
                                  FILE_ATTRIBUTE_NORMAL, nullptr);
  if (file == INVALID_HANDLE_VALUE) CannotWrite(path, GetLastError());
  return OwnedHandle(file);
}

void MakeFolder(const std::wstring& path) {
  std::error_code error;
  std::filesystem::create_directories(path, error);
  if (error) CannotWrite(path, error);
}

}  // namespace

void WriteFileAt(const std::wstring& path, const void* bytes, std::size_t size) {
  const OwnedHandle file = CreateFileAt(path);
  if (!WriteBytes(file.get(), bytes, size)) CannotWrite(path, GetLastError());
}

PageWriter::PageWriter(const std::wstring& folder)
    : folder_(std::filesystem::path(folder).make_preferred().wstring()),
      path_(folder_ + L"\\index.html"),
      unfinishedPath_(path_ + L".part") {
  MakeFolder(folder_ + L"\\" + kPicturesFolder);
  file_ = CreateFileAt(unfinishedPath_);
  const std::string_view page = Template();
  const std::size_t place = page.find(kPlaceOfFiles);
  templateEnd_ = page.substr(place + kPlaceOfFiles.size());
  Write(page.substr(0, place));
  Write("{\"schema\":" + std::to_string(kJsonSchema) + ",\"files\":[");
}

void PageWriter::Add(const FileFacts& facts) {
  std::wstring picture;
  ++count_;
  if (!facts.thumbnail.png.empty()) {
    picture = std::wstring(kPicturesFolder) + L"/" + std::to_wstring(count_) + L".png";
    WriteFileAt(folder_ + L"\\" + picture, facts.thumbnail.png.data(), facts.thumbnail.png.size());
  }
  Write((count_ > 1 ? ",\n" : "\n") + JsonReport(facts, picture));
}

void PageWriter::Finish() {
  Write("\n]}");
  Write(templateEnd_);
  file_.reset();
  if (!MoveFileExW(unfinishedPath_.c_str(), path_.c_str(), MOVEFILE_REPLACE_EXISTING)) {
    CannotWrite(path_, GetLastError());
  }
}

void PageWriter::Write(std::string_view text) {
  if (!WriteBytes(file_.get(), text.data(), text.size())) CannotWrite(unfinishedPath_, GetLastError());
}

}  // namespace Qel::Lumetra::ShellExt::Show
