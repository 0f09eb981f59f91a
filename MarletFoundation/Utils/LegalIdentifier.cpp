#include "MarletFoundation/Utils/LegalIdentifier.h"

#include <bitset>

#include "MarletFoundation/Utils/LegalIdentifierRanges.h"

namespace MarletFoundation {
namespace {

using UnitSet = std::bitset<0x10000>;

template <std::size_t count>
void setRanges(UnitSet& units, const UnitRange (&ranges)[count], bool isIn) {
  for (const auto& [first, last] : ranges) {
    for (std::size_t unit = first; unit <= last; ++unit) units.set(unit, isIn);
  }
}

const UnitSet& invalidIDChars() {
  static const UnitSet units = [] {
    UnitSet all;
    all.set();
    setRanges(all, C99AllowedIDCharRanges, false);
    return all;
  }();
  return units;
}

const UnitSet& invalidInitialIDChars() {
  static const UnitSet units = [] {
    auto all = invalidIDChars();
    setRanges(all, C99DisallowedInitialIDCharRanges, true);
    return all;
  }();
  return units;
}

bool isPair(std::u16string_view text) {
  return text.size() > 1 && (text[0] & 0xFC00) == 0xD800 && (text[1] & 0xFC00) == 0xDC00;
}

}  // namespace

std::u16string mlf_stringByManglingToLegalC99ExtendedIdentifier(std::u16string_view text) {
  std::u16string identifier;
  identifier.reserve(text.size());
  const auto* invalid = &invalidInitialIDChars();
  while (!text.empty()) {
    const bool isInvalid = invalid->test(text[0]);
    identifier += isInvalid ? u'_' : text[0];
    text.remove_prefix(isPair(text) ? 2 : 1);
    invalid = &invalidIDChars();
  }
  return identifier;
}

}  // namespace MarletFoundation
