#include "MarletFoundation/Platform/RegularExpression.h"

#include <gtest/gtest.h>

#include <thread>

#include "MarletFoundation/Platform/ErrorObject.h"

namespace MarletFoundation::test {
namespace {

using Match = RegularExpression::Match;

TEST(RegularExpression, rangesCountUTF16Units) {
  const RegularExpression expression(u"(b)?(c)");
  EXPECT_EQ(expression.firstMatch(u"\U0001F600c"), (Match{{2, 1}, {NotFound, 0}, {2, 1}}));
  EXPECT_EQ(expression.matches(u"bcc"),
            (std::vector<Match>{{{0, 2}, {0, 1}, {1, 1}}, {{2, 1}, {NotFound, 0}, {2, 1}}}));
  EXPECT_EQ(expression.firstMatch({}), std::nullopt);
  EXPECT_EQ(RegularExpression(u"\\U0001F600").firstMatch(u"a\U0001F600"), (Match{{1, 2}}));
}

TEST(RegularExpression, aBadPatternThrows) {
  for (const auto* pattern : {u"(a", u"*", u""}) EXPECT_THROW(RegularExpression{pattern}, ErrorObject);
}

TEST(RegularExpression, givesUpWhereBacktrackingWouldNotEnd) {
  const std::u16string text(100, u'a');
  EXPECT_EQ(RegularExpression(u"(a+)+b").firstMatch(text), std::nullopt);
  const std::u16string longText(1 << 20, u'a');
  EXPECT_EQ(RegularExpression(u"(a|aa)+$").firstMatch(longText + u"b"), std::nullopt);
}

TEST(RegularExpression, matchesFromManyThreadsAtOnce) {
  const RegularExpression expression(u"([0-9]+)x");
  std::vector<std::thread> threads;
  std::vector<int> found(4);
  for (std::size_t i = 0; i < found.size(); ++i) {
    threads.emplace_back([&, i] {
      const auto text = std::u16string(i, u' ') + u"12x";
      for (int round = 0; round < 200; ++round)
        found[i] += expression.firstMatch(text)->at(1).location == static_cast<std::int64_t>(i);
    });
  }
  for (auto& thread : threads) thread.join();
  EXPECT_EQ(found, std::vector<int>(4, 200));
}

}  // namespace
}  // namespace MarletFoundation::test
