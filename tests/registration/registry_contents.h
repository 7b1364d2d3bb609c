// The contents of a registry as a set of lines, which tests compare as a whole:
//
//   HKLM\Software\Classes\.mrc
//   HKLM\Software\Classes\.mrc : InfoTip = s 'prop:System.Comment'
//   HKLM\Software\Classes\CLSID\{...} : @ = s 'a default value'
#pragma once

#include <initializer_list>
#include <set>
#include <string>
#include <utility>

#include "registry_script.h"

namespace Qel::Lumetra::ShellExt::Testing {

using RegistryContents = std::set<std::wstring>;

/// Returns the line of a value. An empty name means the default value.
std::wstring ValueLine(const std::wstring& key, const std::wstring& name, const RegistryData& data);

/// Adds the lines of the key, of all its parent keys, and of its values.
void AddKey(RegistryContents& contents, const std::wstring& key,
            std::initializer_list<std::pair<std::wstring, RegistryData>> values = {});

/// Returns the lines of `a` that are not in `b`.
RegistryContents Without(const RegistryContents& a, const RegistryContents& b);

}  // namespace Qel::Lumetra::ShellExt::Testing
