// What a shell asks the extension about a file, in the way the shell does it: a new object for every request,
// the path or the stream handed over first. Nothing here looks into the file itself.
//
// A fault of the extension ends the process, so all of this runs in the worker process (worker.h). An
// exception that leaves the extension is an answer: its text becomes the problem.
#pragma once

#include <cstdint>
#include <string>

#include "extension_client.h"
#include "file_facts.h"

namespace Qel::Lumetra::ShellExt::Show {

/// The class that the property system is told to use for the file; null for a kind without one.
const CLSID* StoreClassOf(const std::wstring& path);

TipAnswer RequestTip(const ExtensionClient& client, const std::wstring& path);

ListAnswer<Column> RequestColumns(const ExtensionClient& client, const std::wstring& path);

/// The properties of all sets, set after set.
ListAnswer<Property> RequestPropertySets(const ExtensionClient& client, const std::wstring& path);

/// What the property system gets, for the kinds of file for which the extension has a handler.
ListAnswer<Property> RequestPropertyStore(const ExtensionClient& client, const std::wstring& path);

/// The thumbnail for a request of `size` by `size` pixels.
ThumbnailAnswer RequestThumbnail(const ExtensionClient& client, const std::wstring& path, std::int32_t size);

/// Makes an object of a class as any program would, through what is registered. Empty, or a sentence that
/// says why there is none.
std::wstring RequestObject(const std::wstring& clsid);

}  // namespace Qel::Lumetra::ShellExt::Show
