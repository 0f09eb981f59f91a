#pragma once

#include <cstdint>
#include <cstring>
#include <string>
#include <string_view>

#include "MarletFoundation/Platform/Data.h"

/// The scans of text that the property-list readers and writers share.
namespace MarletFoundation::PropertyListText {

inline constexpr std::size_t npos = std::string_view::npos;

/// Offset of the first byte that is neither printable ASCII, delete included, nor tab, line feed or carriage
/// return, or `npos`.
std::size_t findUnusual(std::string_view text);
/// Whether no byte is over 0x7F. Texts of property lists are mostly short.
inline bool isASCII(std::string_view text) {
  constexpr std::uint64_t highBits = 0x8080808080808080;
  const char* place = text.data();
  const char* const end = place + text.size();
  std::uint64_t any = 0;
  std::uint64_t word = 0;
  for (; end - place >= 8; place += 8) {
    std::memcpy(&word, place, 8);
    any |= word;
  }
  if (text.size() >= 8) {
    // The last word overlaps the one before it.
    std::memcpy(&word, end - 8, 8);
    any |= word;
  } else {
    for (; place < end; ++place) any |= static_cast<std::uint8_t>(*place);
  }
  return (any & highBits) == 0;
}
/// Offset of the first byte over 0x7F, or `npos`.
std::size_t findNonASCII(std::string_view text);
/// Offset of the first ill-formed sequence, or `npos`.
std::size_t findInvalidUTF8(std::string_view text);
/// Offset of the first character that XML has none of (most controls, U+FFFE, U+FFFF), or `npos`. The text is
/// valid UTF-8.
std::size_t findInvalidXMLCharacter(std::string_view text);

/// Whether XML can carry the character.
bool isXMLCharacter(char32_t character);
void appendUTF8(std::string& text, char32_t character);

/// The UTF-8 form of 16-bit units, the bytes of each in the given order; nothing is appended from an unpaired
/// surrogate on. Gives the number of bytes that were read: all of them when the text is valid.
std::size_t appendUTF8FromUTF16(std::string& text, std::string_view bytes, bool bigEndian);

/// The bytes, copied in one allocation.
Data copiedData(std::string_view bytes);

/// The character at `place` of valid UTF-8; moves `place` behind it.
char32_t nextCharacter(std::string_view text, std::size_t& place);

}  // namespace MarletFoundation::PropertyListText
