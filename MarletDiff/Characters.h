#pragma once

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

template <class Unit>
bool isASCII(Unit unit) {
  return static_cast<std::make_unsigned_t<Unit>>(unit) < 0x80;
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
  void cutStretchAround(std::size_t offset);

  View<Unit> text_;
  /// For each offset, whether it is known if a character starts there, and whether one does. Empty until the first
  /// question that takes more than a look at both units. Stretches between two offsets where a character always
  /// starts become known as a whole, so that none is ever cut twice, whatever the order of the questions.
  std::vector<bool> known_, starts_;
};

}  // namespace MarletDiff
