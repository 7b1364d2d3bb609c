#include "page_writer.h"

#include <filesystem>

#include "console.h"
#include "file_kinds.h"
#include "json_records.h"
#include "output.h"
#include "page_resource.h"
#include "text_tools.h"

namespace Qel::Lumetra::ShellExt::Show {
namespace {

namespace fs = std::filesystem;

/// The placeholder of the JSON document in the template.
constexpr std::string_view kPlaceOfFiles = "@FILES@";

constexpr const wchar_t* kThumbnailsFolder = L"thumbnails";

/// Returns JSON for a script element of the page. It must not contain '<', which could end the element.
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

void MakeFolder(const std::wstring& path) {
  std::error_code error;
  fs::create_directories(path, error);
  if (error) CannotWrite(path, error);
}

std::wstring ThumbnailName(std::size_t number) {
  return std::to_wstring(number) + L".png";
}

/// Returns the path of a folder that does not exist yet, in `folder`.
std::wstring UnusedFolder(const std::wstring& folder) {
  for (int i = 1;; ++i) {
    std::wstring path = folder + L"\\unfinished-" + std::to_wstring(i);
    if (GetFileAttributesW(path.c_str()) == INVALID_FILE_ATTRIBUTES) return path;
  }
}

}  // namespace

bool IsMarkedPage(std::string_view beginning) {
  return beginning.find(R"(<meta name="generator" content="qelshow">)") != std::string_view::npos;
}

std::wstring PagePath(const std::wstring& folder) {
  return folder + L"\\index.html";
}

std::wstring ThumbnailPath(const std::wstring& folder, std::size_t number) {
  return folder + L"\\" + kThumbnailsFolder + L"\\" + ThumbnailName(number);
}

PageWriter::PageWriter(const std::wstring& folder, const std::wstring& shownFolder)
    : folder_(fs::path(folder).make_preferred().wstring()), unfinished_(UnusedFolder(folder_)) {
  MakeFolder(folder_ + L"\\" + kThumbnailsFolder);
  MakeFolder(unfinished_);
  file_ = CreateNewFile(PagePath(unfinished_));
  const std::string_view page = Template();
  const std::size_t place = page.find(kPlaceOfFiles);
  templateEnd_ = page.substr(place + kPlaceOfFiles.size());
  Write(page.substr(0, place));
  const std::vector<std::wstring> kinds(kExtensions.begin(), kExtensions.end());
  Write("{\"schema\":" + std::to_string(kJsonSchema) + ",\"folder\":" + InScript(Json(shownFolder).dump()) +
        ",\"kinds\":" + Json(kinds).dump() + ",\"files\":[");
}

PageWriter::~PageWriter() {
  file_.Reset();
  std::error_code ignored;
  fs::remove_all(unfinished_, ignored);
}

void PageWriter::Add(const FileFacts& facts) {
  ++count_;
  Json record = facts;
  if (!facts.png.empty()) {
    const std::wstring name = ThumbnailName(count_);
    WriteNewFile(unfinished_ + L"\\" + name, facts.png);
    record["thumbnail"]["file"] = std::wstring(kThumbnailsFolder) + L"/" + name;
    thumbnails_.insert(name);
  }
  Write((count_ > 1 ? ",\n" : "\n") + InScript(record.dump()));
}

void PageWriter::Finish() {
  Write("\n]}");
  Write(templateEnd_);
  file_.Reset();
  const std::wstring thumbnails = folder_ + L"\\" + kThumbnailsFolder + L"\\";
  for (const std::wstring& name : thumbnails_) MoveFileTo(unfinished_ + L"\\" + name, thumbnails + name);
  MoveFileTo(PagePath(unfinished_), PagePath(folder_));
  // Removes the thumbnails that only the earlier page had.
  std::error_code error;
  for (const fs::directory_entry& entry : fs::directory_iterator(thumbnails, error)) {
    const std::wstring path = entry.path().wstring();
    if (!thumbnails_.contains(entry.path().filename().wstring()) && IsThumbnailOfPage(path))
      DeleteFileW(path.c_str());
  }
}

void PageWriter::Write(std::string_view text) {
  if (!WriteBytes(file_.Get(), text.data(), text.size())) CannotWrite(PagePath(unfinished_), GetLastError());
}

}  // namespace Qel::Lumetra::ShellExt::Show
