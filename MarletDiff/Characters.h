#pragma once

#include <array>
#include <cstddef>
#include <string_view>
#include <type_traits>
#include <vector>

namespace MarletDiff {

/// A text in UTF-16, or in well-formed UTF-8: its unit is `char16_t` or `char`.
template <class Unit>
using View = std::basic_string_view<Unit>;

/// U+2029, which ends a line as LF, CR and CR LF do.
template <class Unit>
inline constexpr View<Unit> paragraphSeparator{};
template <>
inline constexpr View<char> paragraphSeparator<char> = "\u2029";
template <>
inline constexpr View<char16_t> paragraphSeparator<char16_t> = u"\u2029";

inline constexpr auto asciiWordUnits = [] {
  std::array<bool, 0x80> isWord{};
  for (char unit = 'a'; unit <= 'z'; ++unit) isWord[unit] = isWord[unit - 'a' + 'A'] = true;
  for (char unit = '0'; unit <= '9'; ++unit) isWord[unit] = true;
  isWord['_'] = true;
  return isWord;
}();

template <class Unit>
bool isASCII(Unit unit) {
  return static_cast<std::make_unsigned_t<Unit>>(unit) < 0x80;
}

template <class Unit>
bool isOfParagraphSeparator(View<Unit> text, std::size_t offset) {
  constexpr auto separator = paragraphSeparator<Unit>;
  for (std::size_t before = 0; before < separator.size() && before <= offset; ++before) {
    if (text.substr(offset - before).starts_with(separator)) return true;
  }
  return false;
}

/// Whether the unit at `offset` is part of a word: a letter, a digit or an underscore, and whatever lies beyond
/// ASCII, so that neither a character's units nor a letter and its marks are ever divided.
template <class Unit>
bool isWordAt(View<Unit> text, std::size_t offset) {
  const auto unit = text[offset];
  return isASCII(unit) ? asciiWordUnits[static_cast<std::size_t>(unit)]
                       : !isOfParagraphSeparator(text, offset);
}

/// Whether a unit ends a line by itself.
template <class Unit>
bool endsLine(Unit unit) {
  return unit == '\n' || unit == '\r';
}

/// Whether `offset` is the start of the text or lies just behind a line's end.
template <class Unit>
bool isLineStart(View<Unit> text, std::size_t offset) {
  if (offset == 0) return true;
  const auto before = text[offset - 1];
  if (before == '\r') return offset == text.size() || text[offset] != '\n';
  return before == '\n' || (!isASCII(before) && text.substr(0, offset).ends_with(paragraphSeparator<Unit>));
}

/// Where the characters (extended grapheme clusters) of a text start.
template <class Unit>
class Characters {
 public:
  explicit Characters(View<Unit> text) : text_(text) {}

  /// Whether a character starts at `offset`, or the text ends there.
  bool startAt(std::size_t offset) {
    if (offset == 0 || offset >= text_.size()) return true;
    const auto before = text_[offset - 1], after = text_[offset];
    if (isASCII(before) && isASCII(after)) return before != '\r' || after != '\n';
    return endsLine(before) || endsLine(after) || startsInStretch(offset);
  }

 private:
  /// Whether a character starts at `offset` whatever lies further off.
  bool alwaysStartsAt(std::size_t offset) const;
  bool startsInStretch(std::size_t offset);

  View<Unit> text_;
  /// The stretch that was looked at last, between two offsets where a character always starts.
  std::size_t stretch_ = 0;
  std::vector<bool> starts_;
};

}  // namespace MarletDiff
