#pragma once

#include <array>
#include <cstddef>

#include "MarletDiff/Characters.h"

// Words are rows of letters, digits and underscores with their marks. Where a script has no blanks, each of its
// characters is a word: which belong together takes a dictionary, and depends on text far off.
namespace MarletDiff {

inline constexpr auto asciiWordUnits = [] {
  std::array<bool, 0x80> isWord{};
  for (char unit = 'a'; unit <= 'z'; ++unit) isWord[unit] = isWord[unit - 'a' + 'A'] = true;
  for (char unit = '0'; unit <= '9'; ++unit) isWord[unit] = true;
  isWord['_'] = true;
  return isWord;
}();

template <class Unit>
bool isASCIIWord(Unit unit) {
  return isASCII(unit) && asciiWordUnits[static_cast<std::size_t>(unit)];
}

/// Whether the last character of one text and the first of another are of one word where the two meet: characters of
/// a word, and whatever belongs to one character. False where either text is empty.
template <class Unit, class OtherUnit>
bool wordSpans(View<Unit> before, View<OtherUnit> after);

/// The same within a text, for an offset of which at least one side is beyond ASCII.
template <class Unit>
bool wordSpansBeyondASCII(View<Unit> text, std::size_t offset);

/// The same for any offset within a text; it may divide a character. False at the text's ends.
template <class Unit>
bool wordSpans(View<Unit> text, std::size_t offset) {
  if (offset == 0 || offset >= text.size()) return false;
  const auto before = text[offset - 1], after = text[offset];
  if (isASCII(before) && isASCII(after)) return isASCIIWord(before) && isASCIIWord(after);
  return wordSpansBeyondASCII(text, offset);
}

/// Whether the first or the last character of a text, which isn't empty, is of a word.
template <class Unit>
bool startsWithWord(View<Unit> text);
template <class Unit>
bool endsWithWord(View<Unit> text);

}  // namespace MarletDiff
