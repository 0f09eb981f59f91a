#include "MarletFoundation/Utils/LegalIdentifier.h"

#include <gtest/gtest.h>

#include "MarletFoundation/Utils/LegalIdentifierRanges.h"

namespace MarletFoundation::test {
namespace {

template <std::size_t count>
bool lies(char16_t unit, const UnitRange (&ranges)[count]) {
  return std::any_of(std::begin(ranges), std::end(ranges),
                     [unit](const UnitRange& range) { return range.first <= unit && unit <= range.last; });
}

TEST(LegalIdentifier, TakesEachUnitByTheListOfRanges) {
  std::size_t allowed = 0;
  for (unsigned number = 0; number < 0x10000; ++number) {
    const auto unit = static_cast<char16_t>(number);
    const bool isAllowed = lies(unit, C99AllowedIDCharRanges);
    const bool isInitial = isAllowed && !lies(unit, C99DisallowedInitialIDCharRanges);
    const std::u16string text{unit, u'a', unit};
    const std::u16string expected{isInitial ? unit : u'_', u'a', isAllowed ? unit : u'_'};
    EXPECT_EQ(stringByManglingToLegalC99ExtendedIdentifier(text), expected) << number;
    allowed += isAllowed;
  }
  // What a compiler takes as C99's identifiers, counted once: 63 of ASCII and 34,958 others.
  EXPECT_EQ(allowed, 63u + 34958u);
}

TEST(LegalIdentifier, KeepsLengthButForPairs) {
  const std::pair<std::u16string_view, std::u16string_view> cases[] = {
      {u"", u""},
      {u"abc_1", u"abc_1"},
      {u"1abc", u"_abc"},
      {u"a-b c", u"a_b_c"},
      {u"\u00E91", u"\u00E91"},
      {u"a\U0001F600b", u"a_b"},
      {u"\U0001F6001", u"_1"},
      {u"\U0001F600\U0001F600", u"__"},
  };
  for (const auto& [text, expected] : cases)
    EXPECT_EQ(stringByManglingToLegalC99ExtendedIdentifier(text), expected);
  EXPECT_EQ(stringByManglingToLegalC99ExtendedIdentifier(std::u16string{0xDC00, 0xD83D}), u"__");
}

}  // namespace
}  // namespace MarletFoundation::test
