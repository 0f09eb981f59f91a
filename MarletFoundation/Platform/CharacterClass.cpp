#include "MarletFoundation/Platform/CharacterClass.h"

#include <unicode/uchar.h>

namespace MarletFoundation {

bool isWordCharacter(char32_t scalar) {
  if (scalar < 0x80) {
    const char32_t lower = scalar | 0x20;
    return (lower >= U'a' && lower <= U'z') || (scalar >= U'0' && scalar <= U'9') || scalar == U'_';
  }
  const auto code = static_cast<UChar32>(scalar);
  return u_isUAlphabetic(code) || scalar == 0x200C || scalar == 0x200D ||
         (U_GET_GC_MASK(code) & (U_GC_M_MASK | U_GC_ND_MASK | U_GC_PC_MASK)) != 0;
}

WordRole wordRole(char32_t scalar) {
  if (scalar < 0x80) return isWordCharacter(scalar) ? WordRole::part : WordRole::none;
  const auto code = static_cast<UChar32>(scalar);
  switch (u_getIntPropertyValue(code, UCHAR_GRAPHEME_CLUSTER_BREAK)) {
    case U_GCB_ZWJ:
    case U_GCB_PREPEND:
      return WordRole::joiner;
    case U_GCB_EXTEND:
    case U_GCB_SPACING_MARK:
      return WordRole::mark;
    default:
      break;
  }
  switch (u_getIntPropertyValue(code, UCHAR_WORD_BREAK)) {
    case U_WB_ALETTER:
    case U_WB_HEBREW_LETTER:
    case U_WB_NUMERIC:
    case U_WB_KATAKANA:
    case U_WB_EXTENDNUMLET:
    case U_WB_REGIONAL_INDICATOR:
      return WordRole::part;
    case U_WB_FORMAT:
      return WordRole::mark;
    default:
      return isWordCharacter(scalar) ? WordRole::whole : WordRole::none;
  }
}

}  // namespace MarletFoundation
