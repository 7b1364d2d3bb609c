// What a parser finds wrong with a header, kept for whoever has to explain it to a user. The extension itself
// only needs to know that there is something.
#pragma once

#include <cstdint>
#include <optional>

namespace Qel::Lumetra::ShellExt {

struct HeaderFault {
  const char* field;
  std::optional<std::int64_t> value;  // none for a field that is no number
  const char* rule;                   // completes "it must be ..."
};

/// Remembers the first requirement that is not met.
class HeaderCheck {
 public:
  HeaderCheck& Require(bool isMet, const char* field, std::optional<std::int64_t> value, const char* rule) {
    if (!isMet && !fault_) fault_ = {field, value, rule};
    return *this;
  }

  const std::optional<HeaderFault>& fault() const { return fault_; }

 private:
  std::optional<HeaderFault> fault_;
};

}  // namespace Qel::Lumetra::ShellExt
