#include "MarletDiff/Words.h"

#include "MarletFoundation/Platform/CharacterClass.h"

namespace MarletDiff {
namespace {

using MarletFoundation::WordRole;

bool dividesCharacter(std::string_view text, std::size_t offset) { return (text[offset] & 0xC0) == 0x80; }
bool dividesCharacter(std::u16string_view text, std::size_t offset) {
  return (text[offset - 1] & 0xFC00) == 0xD800 && (text[offset] & 0xFC00) == 0xDC00;
}

template <class Unit>
View<Unit> lastCharacter(View<Unit> text) {
  auto start = text.size() - 1;
  while (start > 0 && dividesCharacter(text, start)) --start;
  return text.substr(start);
}

char32_t firstScalar(std::u16string_view text) { return MarletFoundation::scalarAt(text, 0); }
char32_t firstScalar(std::string_view text) {
  const auto lead = static_cast<unsigned char>(text[0]);
  if (lead < 0x80) return lead;
  const std::size_t length = lead < 0xE0 ? 2 : lead < 0xF0 ? 3 : 4;
  char32_t scalar = lead & (0x7F >> length);
  for (const char unit : text.substr(1, length - 1)) scalar = scalar << 6 | (unit & 0x3F);
  return scalar;
}

template <class Unit>
WordRole firstRole(View<Unit> text) {
  return MarletFoundation::wordRole(firstScalar(text));
}

bool oneWord(WordRole before, WordRole after) {
  switch (after) {
    case WordRole::mark:
    case WordRole::joiner:
      return true;
    case WordRole::part:
      return before == WordRole::part || before == WordRole::mark || before == WordRole::joiner;
    case WordRole::whole:
    case WordRole::none:
      return before == WordRole::joiner;
  }
  return false;
}

}  // namespace

template <class Unit, class OtherUnit>
bool wordSpans(View<Unit> before, View<OtherUnit> after) {
  return !before.empty() && !after.empty() && oneWord(firstRole(lastCharacter(before)), firstRole(after));
}

template <class Unit>
bool wordSpansBeyondASCII(View<Unit> text, std::size_t offset) {
  return dividesCharacter(text, offset) || wordSpans(text.substr(0, offset), text.substr(offset));
}

template <class Unit>
bool startsWithWord(View<Unit> text) {
  return firstRole(text) != WordRole::none;
}

template <class Unit>
bool endsWithWord(View<Unit> text) {
  return firstRole(lastCharacter(text)) != WordRole::none;
}

template bool wordSpans(View<char>, View<char>);
template bool wordSpans(View<char>, View<char16_t>);
template bool wordSpans(View<char16_t>, View<char>);
template bool wordSpans(View<char16_t>, View<char16_t>);
template bool wordSpansBeyondASCII(View<char>, std::size_t);
template bool wordSpansBeyondASCII(View<char16_t>, std::size_t);
template bool startsWithWord(View<char>);
template bool startsWithWord(View<char16_t>);
template bool endsWithWord(View<char>);
template bool endsWithWord(View<char16_t>);

}  // namespace MarletDiff
