#include "emi_object_path.h"

#include <stdexcept>

namespace Qel::Lumetra::ShellExt {

const EmiItemId& EmiObjectPath::At(std::ptrdiff_t index) const {
  const auto depth = static_cast<std::ptrdiff_t>(items_.size());
  if (index < -depth || index >= depth) throw std::invalid_argument("bad EMI object index");
  return items_[static_cast<std::size_t>(index < 0 ? depth + index : index)];
}

}  // namespace Qel::Lumetra::ShellExt
