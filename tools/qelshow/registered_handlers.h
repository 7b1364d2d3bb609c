// Reads what the registry contains about the extension, as the shell does: the handlers of each file kind,
// and their classes. installation.h evaluates it.
#pragma once

#include <windows.h>

#include <string>
#include <vector>

#include "file_facts.h"

namespace Qel::Lumetra::ShellExt::Show {

/// A registry entry that leads the shell from a file kind to a class.
struct Handler {
  std::wstring role;        // for instance "thumbnail"
  CLSID expected{};         // the extension's class for it
  OptionalText registered;  // identifier of the class that the shell uses
  std::wstring key;         // where it is registered, or would be by the extension
  bool isOwnKey = true;     // whether registering the extension writes this key
};

struct KindOfFile {
  std::wstring extension;  // with its dot
  std::vector<Handler> handlers;
};

/// Returns every file kind with the handlers that the shell uses for it.
std::vector<KindOfFile> ReadHandlers();

/// A registered class. Strings are empty for what is not registered.
struct RegisteredClass {
  bool exists = false;
  std::wstring title;
  OptionalText dll;  // path
  std::wstring threadingModel;
  std::wstring blocked;       // the key, if any, in which the class is blocked
  bool isUnapproved = false;  // a policy allows only approved classes, and this is not one
};

RegisteredClass ReadClass(const std::wstring& clsid);

/// Returns the product code, in braces, under which Windows Installer has installed the extension; an empty
/// string if it has not.
std::wstring InstalledProduct();

/// Returns the version of a program or DLL, for instance "1.0.0"; an empty string if it has none.
std::wstring FileVersion(const std::wstring& path);

}  // namespace Qel::Lumetra::ShellExt::Show
