// Sends the extension the requests that the shell makes for a file, as the shell does: every request uses a
// new object, which first gets the path or the stream. Nothing here reads the file itself.
//
// A fault of the extension crashes the process, so all requests run in the worker process (worker.h). An
// exception that leaves the extension is an answer: its text becomes the problem.
#pragma once

#include <cstdint>
#include <string>

#include "extension_client.h"
#include "file_facts.h"

namespace Qel::Lumetra::ShellExt::Show {

/// Returns the class that is registered with the property system for the file; null for a kind without one.
const CLSID* StoreClassOf(const std::wstring& path);

TipAnswer RequestTip(const ExtensionClient& client, const std::wstring& path);

ListAnswer<Column> RequestColumns(const ExtensionClient& client, const std::wstring& path);

/// Returns the properties of all sets, one set after the other.
ListAnswer<Property> RequestPropertySets(const ExtensionClient& client, const std::wstring& path);

/// Returns the property store of a file. If its kind has none, the problem says so.
ListAnswer<Property> RequestPropertyStore(const ExtensionClient& client, const std::wstring& path);

/// Returns the thumbnail for a request of `size` by `size` pixels.
ThumbnailAnswer RequestThumbnail(const ExtensionClient& client, const std::wstring& path, std::int32_t size);

/// Creates an object of a registered class, as any program would. Returns an empty string, or a sentence
/// with the reason for a failure.
std::wstring RequestObject(const std::wstring& clsid);

}  // namespace Qel::Lumetra::ShellExt::Show
