#pragma once

#include <string_view>

#include "MarletFoundation/Platform/Export.h"

namespace MarletFoundation {

/// The character that begins at unit `at`; an unpaired surrogate stands for itself.
constexpr char32_t scalarAt(std::u16string_view text, std::size_t at) {
  const char32_t unit = text[at];
  if ((unit & 0xFC00) != 0xD800 || at + 1 == text.size() || (text[at + 1] & 0xFC00) != 0xDC00) return unit;
  return (unit << 10) + text[at + 1] - 0x35FDC00;
}

/// UTF-16 units that a character takes.
constexpr std::size_t unitCount(char32_t scalar) { return scalar < 0x10000 ? 1 : 2; }

/// What `\w` stands for in a regular expression: letters, marks, digits, connectors and joiners of any script.
MARLET_EXPORT bool isWordCharacter(char32_t scalar);

/// What a character is to those beside it where a text is cut into words, by the rules of Unicode (UAX #29) but for
/// their dictionaries: what it says depends on nothing but the character.
enum class WordRole {
  /// Of no word: blanks, punctuation, symbols.
  none,
  /// A word by itself, as ideographs, hiragana and the letters of scripts without blanks are.
  whole,
  /// One of a row that makes a word: letters, digits, connectors, katakana.
  part,
  /// Belongs to what stands in front of it, and lets a row go on: marks.
  mark,
  /// Belongs to what stands on either side: joiners, and marks that stand in front.
  joiner,
};
MARLET_EXPORT WordRole wordRole(char32_t scalar);

/// What `$` stops at in a regular expression: U+000A to U+000D, U+0085, U+2028, U+2029.
constexpr bool isLineTerminator(char16_t unit) {
  return (unit >= 0x0A && unit <= 0x0D) || unit == 0x85 || unit == 0x2028 || unit == 0x2029;
}

/// The blanks of Unicode category Zs.
constexpr bool isSpaceSeparator(char16_t unit) {
  return unit == 0x20 || unit == 0xA0 || unit == 0x1680 || (unit >= 0x2000 && unit <= 0x200A) ||
         unit == 0x202F || unit == 0x205F || unit == 0x3000;
}

/// Unicode's white space, which is `\s` in a regular expression.
constexpr bool isWhiteSpace(char16_t unit) {
  return isSpaceSeparator(unit) || isLineTerminator(unit) || unit == u'\t';
}

}  // namespace MarletFoundation
