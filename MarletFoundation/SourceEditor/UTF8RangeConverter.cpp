#include "MarletFoundation/SourceEditor/UTF8RangeConverter.h"

#include <algorithm>
#include <cstring>
#include <limits>

namespace MarletFoundation {
namespace {

constexpr std::int64_t blockUnits = 16;

constexpr bool isHighSurrogate(char16_t unit) { return (unit & 0xFC00) == 0xD800; }
constexpr bool isLowSurrogate(char16_t unit) { return (unit & 0xFC00) == 0xDC00; }

/// Moves over one character.
void step(ConvertedIndex& at, char16_t unit) {
  if (unit < 0x80) {
    at.utf8Index += 1;
  } else if (unit < 0x800) {
    at.utf8Index += 2;
  } else if (isHighSurrogate(unit)) {
    at.utf8Index += 4;
    at.utf16Index += 1;
  } else {
    at.utf8Index += 3;
  }
  at.utf16Index += 1;
}

/// Whether a block is ASCII.
bool isASCII(const char16_t* units) {
  std::uint64_t words[blockUnits * sizeof(char16_t) / sizeof(std::uint64_t)];
  std::memcpy(words, units, sizeof words);
  return !((words[0] | words[1] | words[2] | words[3]) & 0xFF80FF80FF80FF80);
}

/// Bytes of a block that begins and ends between characters, or -1 for one with an unpaired surrogate. The
/// unit behind the block must be there. (Loops of fixed length without branches become a few wide instructions.)
std::int64_t byteCount(const char16_t* units) {
  std::uint16_t bytes = blockUnits;
  std::uint16_t unpaired = isLowSurrogate(units[0]);
  for (int i = 0; i < blockUnits; ++i) {
    const std::uint16_t unit = units[i];
    const bool isSurrogate = (unit & 0xF800) == 0xD800;
    // A half of a pair takes two of its four bytes.
    bytes = static_cast<std::uint16_t>(bytes + (unit >= 0x80) + (unit >= 0x800) - isSurrogate);
    unpaired |= isHighSurrogate(units[i]) != isLowSurrogate(units[i + 1]);
  }
  return unpaired || isHighSurrogate(units[blockUnits - 1]) ? -1 : bytes;
}

/// Moves from `at`, character by character, until one of the limits is reached.
ConvertedIndex advanced(const InlineBuffer& text, ConvertedIndex at, std::int64_t utf8Limit,
                        std::int64_t utf16Limit) {
  while (at.utf8Index < utf8Limit && at.utf16Index < utf16Limit) {
    if (text.endIndex - at.utf16Index > blockUnits) {
      const auto* units = text.units + at.utf16Index;
      if (isASCII(units)) {
        const auto count = std::min({blockUnits, utf8Limit - at.utf8Index, utf16Limit - at.utf16Index});
        at.utf8Index += count;
        at.utf16Index += count;
        continue;
      }
      if (utf16Limit - at.utf16Index >= blockUnits && utf8Limit - at.utf8Index >= blockUnits) {
        const auto bytes = byteCount(units);
        if (bytes >= 0 && bytes <= utf8Limit - at.utf8Index) {
          at.utf8Index += bytes;
          at.utf16Index += blockUnits;
          continue;
        }
      }
    }
    // Enough to come to the end of a pair that a block would cut, or past what isn't paired.
    for (int i = 0; i < blockUnits && at.utf8Index < utf8Limit && at.utf16Index < utf16Limit; ++i)
      step(at, text[at.utf16Index]);
  }
  return at;
}

constexpr auto noLimit = std::numeric_limits<std::int64_t>::max();

}  // namespace

UTF8RangeConverter::UTF8RangeConverter(SharedText text)
    : inlineBuffer_{text->data(), static_cast<std::int64_t>(text->size())}, string_(std::move(text)) {}

UTF8RangeConverter::UTF8RangeConverter(std::u16string text)
    : UTF8RangeConverter(std::make_shared<const std::u16string>(std::move(text))) {}

std::int64_t UTF8RangeConverter::utf16IndexFromUTF8Index(std::int64_t target) {
  if (lastConversion_.utf8Index > target) lastConversion_ = {};
  lastConversion_ = advanced(inlineBuffer_, lastConversion_, target, endIndex());
  return lastConversion_.utf16Index;
}

std::int64_t UTF8RangeConverter::utf8IndexFromUTF16Index(std::int64_t target) {
  if (lastConversion_.utf16Index > target) lastConversion_ = {};
  lastConversion_ = advanced(inlineBuffer_, lastConversion_, noLimit, std::min(target, endIndex()));
  return lastConversion_.utf8Index;
}

}  // namespace MarletFoundation
