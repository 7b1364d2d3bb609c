// What Windows itself shows of a file, compared with what the extension answers when it is asked directly.
#pragma once

#include <windows.h>

#include <shobjidl.h>

#include <cstdint>
#include <string>

#include "com_ptr.h"
#include "extension_client.h"
#include "json_records.h"

namespace Qel::Lumetra::ShellExt::Show {

/// How an answer of the shell compares with the extension's own.
enum class Agreement : std::int32_t {
  kSame,
  kReduced,  // the extension's picture exceeds the request, and the shell's has the shape to which it shrinks
  kDiffers,
  kNothing,    // the shell has no answer where the extension has one
  kUnanswered  // the shell of this system answers no such questions
};

struct ShellAnswer {
  Agreement agreement = Agreement::kUnanswered;
  std::wstring detail;  // what differs, or the code of the failure
};

struct ShellView {
  ShellAnswer thumbnail;
  ShellAnswer properties;
};

NLOHMANN_DEFINE_TYPE_NON_INTRUSIVE(ShellAnswer, agreement, detail)
NLOHMANN_DEFINE_TYPE_NON_INTRUSIVE(ShellView, thumbnail, properties)

/// Asks the shell and the extension for the thumbnail of `size` by `size` pixels and for the properties of
/// the property store. Runs in the worker process. `path` is absolute.
ShellView RequestShellView(const ExtensionClient& client, const std::wstring& path, std::int32_t size);

/// Compares what the shell's item of a file answers with what the extension has answered.
ShellView CompareWithShell(const Com::ComPtr<IShellItem2>& item, const ThumbnailAnswer& thumbnail,
                           const ListAnswer<Property>& properties);

/// Whether the shell shows what it should, or cannot be asked.
bool IsInOrder(const ShellView& view);

/// Says in one sentence what the shell shows and, where that is not what the extension answers, the likely
/// cause.
std::wstring ShellSentence(const ShellView& view, const std::wstring& path);

}  // namespace Qel::Lumetra::ShellExt::Show
