// The open items of an .emi file's tree, from the top level to the innermost item.
#pragma once

#include <cstddef>
#include <cstdint>
#include <vector>

namespace Qel::Lumetra::ShellExt {

/// The beginning of every item. The type determines how the value is stored; type and tag together determine
/// its meaning.
struct EmiItemId {
  std::uint16_t type = 0;
  std::uint16_t tag = 0;

  friend bool operator==(const EmiItemId&, const EmiItemId&) = default;
};

class EmiObjectPath {
 public:
  bool empty() const { return items_.empty(); }

  void Open(EmiItemId id) { items_.push_back(id); }
  void CloseInnermost() { items_.pop_back(); }

  /// Returns an open item: 0 is the outermost one, 1 the next; -1 is the innermost one, -2 its parent. Throws
  /// std::invalid_argument ("bad EMI object index") for an index outside the path.
  const EmiItemId& At(std::ptrdiff_t index) const;

 private:
  std::vector<EmiItemId> items_;  // innermost last
};

}  // namespace Qel::Lumetra::ShellExt
