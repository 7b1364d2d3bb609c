#include "page_writer.h"

#include <filesystem>

#include "console.h"
#include "failure.h"
#include "json_records.h"
#include "page_resource.h"
#include "text_tools.h"

namespace Qel::Lumetra::ShellExt::Show {
namespace {

using Com::OwnedHandle;

/// Where the JSON document stands in the template.
constexpr std::string_view kPlaceOfFiles = "@FILES@";

constexpr const wchar_t* kPicturesFolder = L"pictures";

/// `error` is a code of the system or of the standard library.
template <class Error>
[[noreturn]] void CannotWrite(const std::wstring& path, const Error& error) {
  throw Failure(L"\"" + path + L"\" cannot be written: " + SystemErrorText(error) + L".");
}

/// JSON that can stand in a script element of the page: without '<', which would be able to end the element.
std::string InScript(std::string json) {
  for (std::size_t i = 0; (i = json.find('<', i)) != std::string::npos;) json.replace(i, 1, "\\u003c");
  return json;
}

std::string_view Template() {
  const HRSRC resource =
      FindResourceW(nullptr, MAKEINTRESOURCEW(IDR_PAGE), MAKEINTRESOURCEW(10));  // RT_RCDATA
  const HGLOBAL handle = LoadResource(nullptr, resource);
  return {static_cast<const char*>(LockResource(handle)), SizeofResource(nullptr, resource)};
}

OwnedHandle CreateFileAt(const std::wstring& path) {
  OwnedHandle file(CreateFileW(path.c_str(), GENERIC_WRITE, FILE_SHARE_READ, nullptr, CREATE_ALWAYS,
                               FILE_ATTRIBUTE_NORMAL, nullptr));
  if (!file) CannotWrite(path, GetLastError());
  return file;
}

void MakeFolder(const std::wstring& path) {
  std::error_code error;
  std::filesystem::create_directories(path, error);
  if (error) CannotWrite(path, error);
}

}  // namespace

void WriteFileAt(const std::wstring& path, const void* bytes, std::size_t size) {
  const OwnedHandle file = CreateFileAt(path);
  if (!WriteBytes(file.Get(), bytes, size)) CannotWrite(path, GetLastError());
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
  ++count_;
  Json record = facts;
  if (!facts.png.empty()) {
    const std::wstring picture = std::wstring(kPicturesFolder) + L"/" + std::to_wstring(count_) + L".png";
    WriteFileAt(folder_ + L"\\" + picture, facts.png.data(), facts.png.size());
    record["thumbnail"]["picture"] = picture;
  }
  Write((count_ > 1 ? ",\n" : "\n") + InScript(record.dump()));
}

void PageWriter::Finish() {
  Write("\n]}");
  Write(templateEnd_);
  file_.Reset();
  if (!MoveFileExW(unfinishedPath_.c_str(), path_.c_str(), MOVEFILE_REPLACE_EXISTING)) {
    CannotWrite(path_, GetLastError());
  }
}

void PageWriter::Write(std::string_view text) {
  if (!WriteBytes(file_.Get(), text.data(), text.size())) CannotWrite(unfinishedPath_, GetLastError());
}

}  // namespace Qel::Lumetra::ShellExt::Show
