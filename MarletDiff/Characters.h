#pragma once

#include <array>
#include <cstddef>
#include <string_view>
#include <vector>

namespace MarletDiff {

/// U+2029, which ends a line as LF, CR and CR LF do.
inline constexpr char16_t ParagraphSeparator = u'\u2029';

inline constexpr auto asciiWordUnits = [] {
  std::array<bool, 0x80> isWord{};
  for (char unit = 'a'; unit <= 'z'; ++unit) isWord[unit] = isWord[unit - 'a' + 'A'] = true;
  for (char unit = '0'; unit <= '9'; ++unit) isWord[unit] = true;
  isWord['_'] = true;
  return isWord;
}();

/// Whether a UTF-16 unit is part of a word: a letter, a digit or an underscore, and whatever lies beyond
/// ASCII, so that neither a surrogate pair nor a letter with its marks is ever divided.
inline bool isWordUnit(char16_t unit) {
  return unit < asciiWordUnits.size() ? asciiWordUnits[unit] : unit != ParagraphSeparator;
}

inline bool endsLine(char16_t unit) { return unit == u'\n' || unit == u'\r' || unit == ParagraphSeparator; }

/// Whether `offset` is the start of the text or lies just behind a line's end.
bool isLineStart(std::u16string_view text, std::size_t offset);

/// Where the characters (extended grapheme clusters) of a text start.
class Characters {
 public:
  explicit Characters(std::u16string_view text) : text_(text) {}

  /// Whether a character starts at `offset`, or the text ends there.
  bool startAt(std::size_t offset) {
    if (offset == 0 || offset >= text_.size()) return true;
    const char16_t before = text_[offset - 1], after = text_[offset];
    if ((before | after) < 0x80) return before != u'\r' || after != u'\n';
    return endsLine(before) || endsLine(after) || startsInStretch(offset);
  }

 private:
  /// Whether a character starts at `offset` whatever lies further off.
  bool alwaysStartsAt(std::size_t offset) const;
  bool startsInStretch(std::size_t offset);

  std::u16string_view text_;
  /// The stretch that was looked at last, between two offsets where a character always starts.
  std::size_t stretch_ = 0;
  std::vector<bool> starts_;
};

}  // namespace MarletDiff
