#include "tools/datapack/json_location.h"

#include <charconv>
#include <cmath>
#include <cstdlib>
#include <string>

namespace datapack {
namespace {

// Steps through a well-formed JSON text without building anything.
class Walker {
 public:
  explicit Walker(std::string_view text) : text_(text) {}

  std::size_t At() {
    SkipSpace();
    return at_;
  }
  char Next() { return At() < text_.size() ? text_[at_] : '\0'; }

  // The raw text of a string token, quotes included; the walker moves past it.
  std::string_view String() {
    const std::size_t start = At();
    for (++at_; at_ < text_.size() && text_[at_] != '"'; ++at_) {
      if (text_[at_] == '\\') ++at_;
    }
    return text_.substr(start, ++at_ - start);
  }

  void SkipValue() {
    const char c = Next();
    if (c == '"') {
      String();
    } else if (c == '{' || c == '[') {
      ++at_;
      while (Next() != '}' && Next() != ']' && at_ < text_.size()) {
        if (c == '{') {
          String();
          Expect(':');
        }
        SkipValue();
        if (Next() == ',') ++at_;
      }
      ++at_;
    } else {
      while (at_ < text_.size() && std::string_view(",]} \t\r\n").find(text_[at_]) == npos)
        ++at_;
    }
  }

  // Moves to the member named `key` of the object here; false when it has none.
  bool EnterMember(std::string_view key) {
    if (Next() != '{') return false;
    ++at_;
    while (Next() == '"') {
      const bool found = Decoded(String()) == key;
      Expect(':');
      if (found) return true;
      SkipValue();
      if (Next() == ',') ++at_;
    }
    return false;
  }

  bool EnterItem(std::size_t index) {
    if (Next() != '[') return false;
    ++at_;
    for (std::size_t i = 0; i < index; ++i) {
      if (Next() == ']') return false;
      SkipValue();
      if (Next() == ',') ++at_;
    }
    return Next() != ']';
  }

 private:
  static constexpr std::size_t npos = std::string_view::npos;

  void Expect(char c) {
    if (Next() == c) ++at_;
  }

  void SkipSpace() {
    while (at_ < text_.size() && std::string_view(" \t\r\n").find(text_[at_]) != npos)
      ++at_;
  }

  // The keys looked for are plain ASCII: dropping the backslashes decodes enough to match them.
  static std::string Decoded(std::string_view raw) {
    std::string key;
    for (std::size_t i = 1; i + 1 < raw.size(); ++i) {
      if (raw[i] == '\\') ++i;
      key += raw[i];
    }
    return key;
  }

  std::string_view text_;
  std::size_t at_ = 0;
};

}  // namespace

std::size_t LocateJsonPointer(std::string_view text, std::string_view pointer) {
  Walker walker(text);
  std::size_t found = walker.At();
  while (!pointer.empty()) {
    pointer.remove_prefix(1);
    const std::string_view token = pointer.substr(0, pointer.find('/'));
    pointer.remove_prefix(token.size());
    std::size_t index = 0;
    const auto [end, error] = std::from_chars(token.data(), token.data() + token.size(), index);
    const bool isIndex = error == std::errc() && end == token.data() + token.size();
    if (walker.Next() == '[' ? !isIndex || !walker.EnterItem(index) : !walker.EnterMember(token)) {
      break;
    }
    found = walker.At();
  }
  return found;
}

std::size_t FindOverflowingNumber(std::string_view text, std::size_t from) {
  for (std::size_t at = from; at < text.size(); ++at) {
    if (text[at] == '"') {
      for (++at; at < text.size() && text[at] != '"'; ++at) {
        if (text[at] == '\\') ++at;
      }
    } else if (text[at] == '-' || (text[at] >= '0' && text[at] <= '9')) {
      const std::size_t end = text.find_first_not_of("+-.0123456789eE", at);
      const std::string number(text.substr(at, end - at));
      // As the JSON parser reads it, in the "C" locale the program runs in.
      if (std::isinf(std::strtof(number.c_str(), nullptr))) return at;
      at += number.size() - 1;
    }
  }
  return std::string_view::npos;
}

}  // namespace datapack
