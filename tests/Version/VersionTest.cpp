#include "MarletFoundation/Version/Version.h"

#include <gtest/gtest.h>
#include <rapidcheck.h>

#include <stdexcept>

#include "MarletFoundation/Platform/FatalError.h"
#include "MarletFoundation/Version/ManifestVersion.h"
#include "support/Fatal.h"

namespace MarletFoundation::test {

TEST(Version, ParsesDottedIntegersOnly) {
  const struct {
    const char* text;
    const char* printed;  // null where nothing is parsed
  } cases[] = {
      {"1", "1"},       {"1.2.3.4", "1.2.3.4"}, {"01.002", "1.2"}, {"+1.-2", "1.-2"},
      {"", nullptr},    {"1.", nullptr},        {".1", nullptr},   {"1..2", nullptr},
      {"1.a", nullptr}, {"1 .2", nullptr},      {"0x1", nullptr},  {"9223372036854775808", nullptr},
  };
  for (const auto& c : cases) {
    const auto version = Version::fromString(c.text);
    ASSERT_EQ(version.has_value(), c.printed != nullptr) << c.text;
    if (version) {
      EXPECT_EQ(version->versionString(), c.printed);
    }
  }
  EXPECT_EQ(Version({7}).minorVersion(), std::nullopt);
  EXPECT_EQ(Version({7, 8, 9}).patchVersion(), 9);
}

TEST(Version, OrderingPadsWhileEqualityIsExact) {
  const Version shorter({1, 0}), longer({1, 0, 0});
  EXPECT_FALSE(shorter == longer);
  EXPECT_FALSE(shorter < longer || longer < shorter);
  EXPECT_TRUE(shorter <= longer && shorter >= longer);
  EXPECT_LT(Version({1, 2}), Version({1, 10}));
  EXPECT_GT(Version({2}), Version({1, 9, 9}));
  EXPECT_LT(Version({1, -1}), Version({1}));
}

TEST(Version, WithoutComponentsIsFatal) {
  EXPECT_EQ(fatalMessage([] { Version({}).majorVersion(); }), "Versions must have at least one component!");
}

TEST(ManifestVersion, GateLooksAtTheFirstTwoNumbers) {
  using V = ManifestVersionVerdict;
  const std::pair<const char*, V> cases[] = {
      {"1.0", V::readable}, {"1.999", V::readable}, {"1.0.x", V::readable}, {"2.0", V::tooNew},
      {"0.9", V::invalid},  {"1", V::invalid},      {"1.-1", V::invalid},   {"one.0", V::invalid},
      {"2.x", V::invalid},  {"", V::invalid},       {"1.", V::invalid},
  };
  for (const auto& [text, verdict] : cases) EXPECT_EQ(judgeManifestVersion(text), verdict) << text;
}

}  // namespace MarletFoundation::test
