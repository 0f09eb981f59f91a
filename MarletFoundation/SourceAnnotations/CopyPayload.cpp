#include "MarletFoundation/SourceAnnotations/CopyPayload.h"

#include <algorithm>
#include <iterator>

#include "MarletFoundation/Platform/CharacterClass.h"

namespace MarletFoundation {
namespace {

struct ScalarRange {
  char32_t first;
  char32_t last;
};

/// Beyond ASCII, in the basic plane: what may begin an identifier of the language that pages are written in.
constexpr ScalarRange identifierHeads[] = {
    {0xA8, 0xA8},     {0xAA, 0xAA},     {0xAD, 0xAD},     {0xAF, 0xAF},     {0xB2, 0xB5},
    {0xB7, 0xBA},     {0xBC, 0xBE},     {0xC0, 0xD6},     {0xD8, 0xF6},     {0xF8, 0xFF},
    {0x100, 0x2FF},   {0x370, 0x167F},  {0x1681, 0x180D}, {0x180F, 0x1DBF}, {0x1E00, 0x1FFF},
    {0x200B, 0x200D}, {0x202A, 0x202E}, {0x203F, 0x2040}, {0x2054, 0x2054}, {0x2060, 0x206F},
    {0x2070, 0x20CF}, {0x2100, 0x218F}, {0x2460, 0x24FF}, {0x2776, 0x2793}, {0x2C00, 0x2DFF},
    {0x2E80, 0x2FFF}, {0x3004, 0x3007}, {0x3021, 0x302F}, {0x3031, 0x303F}, {0x3040, 0xD7FF},
    {0xF900, 0xFD3D}, {0xFD40, 0xFDCF}, {0xFDF0, 0xFE1F}, {0xFE30, 0xFE44}, {0xFE47, 0xFFFD}};

constexpr ScalarRange combiningMarks[] = {
    {0x300, 0x36F}, {0x1DC0, 0x1DFF}, {0x20D0, 0x20FF}, {0xFE20, 0xFE2F}};

bool isIn(const ScalarRange* begin, const ScalarRange* end, char32_t scalar) {
  const auto range =
      std::find_if(begin, end, [&](const ScalarRange& candidate) { return scalar <= candidate.last; });
  return range != end && scalar >= range->first;
}

bool isIdentifierHead(char32_t scalar) {
  if (scalar < 0x80) {
    const char32_t lower = scalar | 0x20;
    return (lower >= U'a' && lower <= U'z') || scalar == U'_';
  }
  if (scalar < 0x10000) return isIn(std::begin(identifierHeads), std::end(identifierHeads), scalar);
  return scalar < 0xF0000 && (scalar & 0xFFFF) <= 0xFFFD;
}

bool isIdentifierTail(char32_t scalar) {
  return isIdentifierHead(scalar) || (scalar >= U'0' && scalar <= U'9') || scalar == U'$' ||
         isIn(std::begin(combiningMarks), std::end(combiningMarks), scalar);
}

/// The identifier when `text` is one and a ")" behind it.
std::optional<std::u16string_view> closedIdentifier(std::u16string_view text) {
  std::size_t at = 0;
  while (at < text.size()) {
    const auto scalar = scalarAt(text, at);
    if (!(at == 0 ? isIdentifierHead(scalar) : isIdentifierTail(scalar))) break;
    at += unitCount(scalar);
  }
  if (at == 0 || text.substr(at) != u")") return std::nullopt;
  return text.substr(0, at);
}

}  // namespace

/// The language of `^\(IDENTIFIER\)`, whose stated pattern nests its repetitions.
std::optional<std::u16string_view> extractCopySourceParts(std::u16string_view payload) {
  if (!payload.starts_with(u'(')) return std::nullopt;
  return closedIdentifier(payload.substr(1));
}

/// The language of `^\("((?:[^"]|\\")+?)", IDENTIFIER\)`. The reference ends at the first double quote that the
/// rest follows; each one that it passes over has a backslash in front.
std::optional<CopyDestinationParts> extractCopyDestinationParts(std::u16string_view payload) {
  constexpr std::u16string_view opening = u"(\"";
  if (!payload.starts_with(opening)) return std::nullopt;
  const auto text = payload.substr(opening.size());
  for (std::size_t quote = text.find(u'"'); quote != text.npos && quote > 0;
       quote = text.find(u'"', quote + 1)) {
    const auto rest = text.substr(quote + 1);
    if (rest.starts_with(u", ")) {
      if (const auto identifier = closedIdentifier(rest.substr(2)))
        return CopyDestinationParts{text.substr(0, quote), *identifier};
    }
    if (text[quote - 1] != u'\\') return std::nullopt;
  }
  return std::nullopt;
}

}  // namespace MarletFoundation
