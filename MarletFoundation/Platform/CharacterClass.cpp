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

}  // namespace MarletFoundation
