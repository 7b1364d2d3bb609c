#include "registry_script.h"

#include <algorithm>
#include <limits>
#include <utility>

#include "same_text.h"

namespace Qel::Lumetra::ShellExt {
namespace {

constexpr std::wstring_view kWhiteSpace = L" \t\r\n";
constexpr std::wstring_view kEndOfBareWord = L" \t\r\n{}='";

bool IsScriptByte(char c) {
  return (c >= ' ' && c <= '~') || c == '\t' || c == '\r' || c == '\n';
}

std::wstring Widen(std::string_view ascii) {
  return {ascii.begin(), ascii.end()};
}

/// Replaces every `%name%` once; the replacement itself is not searched again. Returns nothing for a byte
/// that no script may contain, an unknown name or a `%` without its partner.
std::optional<std::wstring> Expand(std::string_view text, std::span<const Replacement> replacements) {
  if (!std::ranges::all_of(text, IsScriptByte)) return std::nullopt;

  std::wstring expanded;
  for (;;) {
    const std::size_t opening = text.find('%');
    expanded += Widen(text.substr(0, opening));
    if (opening == std::string_view::npos) return expanded;

    const std::size_t closing = text.find('%', opening + 1);
    if (closing == std::string_view::npos) return std::nullopt;
    const std::wstring name = Widen(text.substr(opening + 1, closing - opening - 1));
    const auto found = std::ranges::find_if(
        replacements, [&](const auto& each) { return SameIgnoringCase(each.name, name); });
    if (found == replacements.end()) return std::nullopt;
    expanded += found->value;
    text.remove_prefix(closing + 1);
  }
}

enum class TokenKind { kEnd, kOpen, kClose, kEquals, kWord, kQuoted, kUnfinished };

struct Token {
  TokenKind kind = TokenKind::kEnd;
  std::wstring text;  // of a word or a quoted string, without its quotes

  bool IsKeyword(std::wstring_view word) const {
    return kind == TokenKind::kWord && SameIgnoringCase(text, word);
  }
};

class Tokenizer {
 public:
  explicit Tokenizer(std::wstring_view text) : rest_(text) {}

  Token Next() {
    rest_.remove_prefix(std::min(rest_.find_first_not_of(kWhiteSpace), rest_.size()));
    if (rest_.empty()) return {};
    switch (rest_.front()) {
      case L'{': return Punctuation(TokenKind::kOpen);
      case L'}': return Punctuation(TokenKind::kClose);
      case L'=': return Punctuation(TokenKind::kEquals);
      case L'\'': return Quoted();
      default: return {TokenKind::kWord, Take(rest_.find_first_of(kEndOfBareWord))};
    }
  }

 private:
  std::wstring Take(std::size_t count) {
    std::wstring taken(rest_.substr(0, count));
    rest_.remove_prefix(taken.size());
    return taken;
  }

  Token Punctuation(TokenKind kind) {
    rest_.remove_prefix(1);
    return {kind, {}};
  }

  /// Reads a quoted string, in which a quote is written twice. The string must end on the line that it begins
  /// on.
  Token Quoted() {
    Token token{TokenKind::kQuoted, {}};
    rest_.remove_prefix(1);
    for (;;) {
      token.text += Take(rest_.find_first_of(L"'\r\n"));
      if (!rest_.starts_with(L'\'')) return {TokenKind::kUnfinished, {}};
      rest_.remove_prefix(1);
      if (!rest_.starts_with(L'\'')) return token;
      token.text += L'\'';
      rest_.remove_prefix(1);
    }
  }

  std::wstring_view rest_;
};

std::optional<std::uint32_t> ParseNumber(std::wstring_view digits) {
  if (digits.empty()) return std::nullopt;
  std::uint64_t number = 0;
  for (const wchar_t c : digits) {
    if (c < L'0' || c > L'9') return std::nullopt;
    number = number * 10 + static_cast<std::uint64_t>(c - L'0');
    if (number > std::numeric_limits<std::uint32_t>::max()) return std::nullopt;
  }
  return static_cast<std::uint32_t>(number);
}

/// Parses with one token of lookahead. Every parsing function returns false where the input is not a valid
/// script.
class Parser {
 public:
  explicit Parser(std::wstring_view text) : tokenizer_(text), token_(tokenizer_.Next()) {}

  bool ParseScript(RegistryScript& script) {
    while (token_.kind != TokenKind::kEnd) {
      RegistryRoot root{};
      if (!ParseRoot(root) || !Accept(TokenKind::kOpen) || !ParseBlock(root, script)) return false;
    }
    return true;
  }

 private:
  /// Parses up to and including the brace that closes the root's block. A stack of positions in `script`
  /// keeps track of nested blocks, so that nesting needs no recursion.
  bool ParseBlock(RegistryRoot root, RegistryScript& script) {
    std::vector<std::size_t> open;
    for (;;) {
      if (Accept(TokenKind::kClose)) {
        if (open.empty()) return true;
        open.pop_back();
      } else if (AcceptKeyword(L"val")) {
        ScriptValue value;
        if (open.empty() || !ParseName(value.name) || !Accept(TokenKind::kEquals) || !ParseData(value.data)) {
          return false;
        }
        script[open.back()].values.push_back(std::move(value));
      } else {
        ScriptKey key;
        key.root = root;
        key.depth = open.size();
        if (key.depth == kMaxKeyNesting || !ParseKey(key)) return false;
        script.push_back(std::move(key));
        if (Accept(TokenKind::kOpen)) open.push_back(script.size() - 1);
      }
    }
  }

  bool ParseRoot(RegistryRoot& root) {
    if (AcceptKeyword(L"HKCR")) {
      root = RegistryRoot::kClassesRoot;
      return true;
    }
    root = RegistryRoot::kLocalMachine;
    return AcceptKeyword(L"HKLM");
  }

  bool ParseKey(ScriptKey& key) {
    if (AcceptKeyword(L"ForceRemove")) {
      key.mark = KeyMark::kForceRemove;
    } else if (AcceptKeyword(L"NoRemove")) {
      key.mark = KeyMark::kNoRemove;
    }
    // An empty name would mean the enclosing key, and a backslash a key below this one.
    if (!ParseName(key.name) || key.name.empty() || key.name.find(L'\\') != std::wstring::npos) return false;
    return !Accept(TokenKind::kEquals) || ParseData(key.defaultValue.emplace());
  }

  bool ParseData(RegistryData& data) {
    const bool isNumber = token_.IsKeyword(L"d");
    if (!isNumber && !token_.IsKeyword(L"s")) return false;
    Advance();
    std::wstring text;
    if (!ParseText(text)) return false;
    if (!isNumber) {
      data = std::move(text);
      return true;
    }
    const auto number = ParseNumber(text);
    if (number) data = *number;
    return number.has_value();
  }

  /// Parses the name of a key or a value. A keyword must be quoted to be a name, so two marks in a row are an
  /// error and not a mark and a name.
  bool ParseName(std::wstring& name) {
    const bool isKeyword =
        token_.IsKeyword(L"val") || token_.IsKeyword(L"ForceRemove") || token_.IsKeyword(L"NoRemove");
    return !isKeyword && ParseText(name);
  }

  bool ParseText(std::wstring& text) {
    if (token_.kind != TokenKind::kWord && token_.kind != TokenKind::kQuoted) return false;
    text = std::move(token_.text);
    Advance();
    return true;
  }

  bool Accept(TokenKind kind) {
    if (token_.kind != kind) return false;
    Advance();
    return true;
  }

  bool AcceptKeyword(std::wstring_view word) {
    if (!token_.IsKeyword(word)) return false;
    Advance();
    return true;
  }

  void Advance() { token_ = tokenizer_.Next(); }

  Tokenizer tokenizer_;
  Token token_;
};

}  // namespace

std::optional<RegistryScript> ParseRegistryScript(std::string_view text,
                                                  std::span<const Replacement> replacements) {
  const auto expanded = Expand(text, replacements);
  if (!expanded) return std::nullopt;
  RegistryScript script;
  if (!Parser(*expanded).ParseScript(script)) return std::nullopt;
  return script;
}

}  // namespace Qel::Lumetra::ShellExt
