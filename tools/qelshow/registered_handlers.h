// What the registry says of the extension: the handlers of each kind of file, and the classes behind them.
// Read as the shell reads it, and not judged here (installation.h does that).
#pragma once

#include <windows.h>

#include <string>
#include <vector>

#include "file_facts.h"

namespace Qel::Lumetra::ShellExt::Show {

/// One of the ways on which the shell comes from a kind of file to a class.
struct Handler {
  std::wstring role;        // for instance "thumbnail"
  CLSID expected{};         // the extension's class for it
  OptionalText registered;  // identifier of the class that the shell takes
  std::wstring key;         // where it is registered; where the extension's own is to be, without one
  bool isOwnKey = true;     // whether that is the key which registering the extension writes
};

struct KindOfFile {
  std::wstring extension;  // with its dot
  std::vector<Handler> handlers;
};

/// Every kind of file with the handlers that the extension has for it.
std::vector<KindOfFile> ReadHandlers();

/// A registered class; empty texts for what is not registered.
struct RegisteredClass {
  bool exists = false;
  std::wstring title;
  OptionalText dll;  // path
  std::wstring threadingModel;
  std::wstring blocked;       // the key, if any, that keeps the shell from using the class
  bool isUnapproved = false;  // a policy demands that it is in a list, and it is not
};

RegisteredClass ReadClass(const std::wstring& clsid);

/// The product code under which Windows Installer has installed the extension, with its braces; empty
/// without.
std::wstring InstalledProduct();

/// The version of a program or DLL, for instance "1.0.0"; empty for a file without one.
std::wstring FileVersion(const std::wstring& path);

}  // namespace Qel::Lumetra::ShellExt::Show
