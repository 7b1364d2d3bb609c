#include "registry_contents.h"

#include <algorithm>
#include <iterator>

namespace Qel::Lumetra::ShellExt::Testing {

std::wstring ValueLine(const std::wstring& key, const std::wstring& name, const RegistryData& data) {
  const auto* text = std::get_if<std::wstring>(&data);
  return key + L" : " + (name.empty() ? L"@" : name) +
         (text ? L" = s '" + *text + L"'" : L" = d " + std::to_wstring(std::get<std::uint32_t>(data)));
}

void AddKey(RegistryContents& contents, const std::wstring& key,
            std::initializer_list<std::pair<std::wstring, RegistryData>> values) {
  for (std::size_t end = key.find(L'\\'); end != std::wstring::npos; end = key.find(L'\\', end + 1)) {
    contents.insert(key.substr(0, end));
  }
  contents.insert(key);
  for (const auto& [name, data] : values) contents.insert(ValueLine(key, name, data));
}

RegistryContents Without(const RegistryContents& a, const RegistryContents& b) {
  RegistryContents difference;
  std::ranges::set_difference(a, b, std::inserter(difference, difference.end()));
  return difference;
}

}  // namespace Qel::Lumetra::ShellExt::Testing
