#include "MarletDiff/Tokens.h"

namespace MarletDiff {
namespace {

constexpr char16_t paragraphSeparator = u'\u2029';

/// The offset behind the character at `offset`, CR LF taken as one.
std::size_t characterEnd(std::u16string_view text, std::size_t offset) {
  return offset + (text.substr(offset, 2) == u"\r\n" ? 2 : 1);
}

bool endsLine(char16_t unit) { return unit == u'\n' || unit == u'\r' || unit == paragraphSeparator; }

}  // namespace

bool isWordUnit(char16_t unit) {
  if (unit >= 0x80) return unit != paragraphSeparator;
  return (unit >= u'a' && unit <= u'z') || (unit >= u'A' && unit <= u'Z') || (unit >= u'0' && unit <= u'9') ||
         unit == u'_';
}

Tokens Tokens::lines(std::u16string_view text) {
  Tokens tokens(text);
  for (std::size_t offset = 0; offset < text.size();) {
    while (offset < text.size() && !endsLine(text[offset])) ++offset;
    if (offset < text.size()) offset = characterEnd(text, offset);
    tokens.ends_.push_back(offset);
  }
  return tokens;
}

Tokens Tokens::words(std::u16string_view text) {
  Tokens tokens(text);
  for (std::size_t offset = 0; offset < text.size();) {
    if (isWordUnit(text[offset])) {
      while (offset < text.size() && isWordUnit(text[offset])) ++offset;
    } else {
      offset = characterEnd(text, offset);
    }
    tokens.ends_.push_back(offset);
  }
  return tokens;
}

}  // namespace MarletDiff
