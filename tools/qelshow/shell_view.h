// Compares what Windows itself shows for a file with what the extension returns.
#pragma once

#include <windows.h>

#include <shobjidl.h>

#include <cstdint>
#include <string>

#include "com_ptr.h"
#include "extension_client.h"
#include "json_records.h"

namespace Qel::Lumetra::ShellExt::Show {

/// How an answer of the shell compares with the extension's.
enum class Agreement : std::int32_t {
  kSame,
  kReduced,  // the extension's thumbnail exceeds the request, and the shell's has its proportions
  kDiffers,
  kNothing,    // the shell has no answer, but the extension has one
  kUnanswered  // the shell of this system does not answer such requests
};

struct ShellAnswer {
  Agreement agreement = Agreement::kUnanswered;
  std::wstring detail;  // the difference, or the text of the failure
};

struct ShellView {
  ShellAnswer thumbnail;
  ShellAnswer properties;
};

NLOHMANN_DEFINE_TYPE_NON_INTRUSIVE(ShellAnswer, agreement, detail)
NLOHMANN_DEFINE_TYPE_NON_INTRUSIVE(ShellView, thumbnail, properties)

/// Requests the thumbnail of `size` by `size` pixels and the properties of the property store from the shell
/// and from the extension, and compares them. Runs in the worker process. `path` is absolute.
ShellView RequestShellView(const ExtensionClient& client, const std::wstring& path, std::int32_t size);

/// Compares the answers of `item`, the file in the shell, with those of the extension.
ShellView CompareWithShell(const Com::ComPtr<IShellItem2>& item, const ThumbnailAnswer& thumbnail,
                           const ListAnswer<Property>& properties);

/// Returns whether the shell shows what it should, or does not answer.
bool IsAsExpected(const ShellView& view);

/// Returns a sentence that says what the shell shows and, if that differs from the extension's answers,
/// another with the likely cause.
std::wstring ShellText(const ShellView& view, const std::wstring& path);

}  // namespace Qel::Lumetra::ShellExt::Show
