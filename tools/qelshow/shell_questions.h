// What a shell asks the extension about a file, asked in the shell's way: a new object for every question,
// the path or the stream handed over first. Nothing here looks into the file itself.
//
// A fault of the extension ends the process, so all of this runs in the worker process (worker.h). An
// exception that leaves the extension is an answer: its text becomes the problem.
#pragma once

#include <cstdint>
#include <string>

#include "file_facts.h"
#include "server.h"

namespace Qel::Lumetra::ShellExt::Show {

/// The class that the property system is told to use for the file; null for a kind without one.
const CLSID* StoreClassOf(const std::wstring& path);

TipAnswer AskTip(const Server& server, const std::wstring& path);

ListAnswer<Column> AskColumns(const Server& server, const std::wstring& path);

/// The properties of all sets, set after set.
ListAnswer<Property> AskPropertySets(const Server& server, const std::wstring& path);

/// What the property system gets, for the kinds of file for which the extension has a handler.
ListAnswer<Property> AskPropertyStore(const Server& server, const std::wstring& path);

/// The thumbnail for a request of `size` by `size` pixels.
Thumbnail AskThumbnail(const Server& server, const std::wstring& path, std::int32_t size);

/// Makes an object of a class as any program would, through what is registered. Empty, or a sentence that
/// says why there is none.
std::wstring AskCreation(const std::wstring& clsid);

}  // namespace Qel::Lumetra::ShellExt::Show
