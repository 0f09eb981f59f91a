#include "MarletFoundation/Platform/Host.h"

#include <gtest/gtest.h>
#include <pwd.h>
#include <stdlib.h>
#include <unistd.h>

#include <regex>
#include <set>
#include <thread>

#include "MarletFoundation/Platform/Digest.h"
#include "MarletFoundation/Platform/HostEnvironment.h"
#include "support/Tree.h"

namespace MarletFoundation::test {
namespace {

/// An environment variable, set or (null) unset for the length of a test.
class Variable {
 public:
  Variable(const char* name, const char* value) : name_(name) {
    if (const char* before = ::getenv(name)) before_ = before;
    set(value);
  }
  ~Variable() { set(before_ ? before_->c_str() : nullptr); }

 private:
  void set(const char* value) { value ? ::setenv(name_, value, 1) : ::unsetenv(name_); }
  const char* name_;
  std::optional<std::string> before_;
};

TEST(HostEnvironment, DefaultsComeFromTheEnvironment) {
  const TemporaryDirectory directory;
  const Variable home("HOME", "/h/me/");
  const Variable documents("XDG_DOCUMENTS_DIR", nullptr), data("XDG_DATA_HOME", "relative");
  const Variable resources("MARLET_RESOURCES", directory.path().c_str());
  const auto environment = HostEnvironment::defaults();
  EXPECT_EQ(environment.documentsDirectory, URL::file("/h/me/Documents", true));
  EXPECT_EQ(environment.applicationSupportDirectory, URL::file("/h/me/.local/share", true));
  EXPECT_EQ(environment.groupContainer("group.x"), URL::file("/h/me/.local/share/group.x", true));
  EXPECT_EQ(environment.groupContainer("../x"), std::nullopt);
  EXPECT_EQ(environment.groupContainer(".."), std::nullopt);
  EXPECT_EQ(environment.resourcesDirectory, directory.url());

  const Variable noHome("HOME", nullptr), named("XDG_DOCUMENTS_DIR", "/d");
  const auto homeless = HostEnvironment::defaults();
  EXPECT_EQ(homeless.documentsDirectory, URL::file("/d", true));
  // The system knows the user's home also where the process wasn't told.
  const auto* user = ::getpwuid(::geteuid());
  const auto support =
      user ? std::optional(URL::file(std::string(user->pw_dir) + "/.local/share", true)) : std::nullopt;
  EXPECT_EQ(homeless.applicationSupportDirectory, support);
  EXPECT_EQ(homeless.groupContainer("group.x").has_value(), support.has_value());
}

TEST(HostEnvironment, UserDefaultsAreWholeIntegers) {
  const auto environment = HostEnvironment::defaults();
  const std::pair<const char*, std::optional<std::int64_t>> rows[] = {{"3", 3},
                                                                      {"-2", -2},
                                                                      {"", std::nullopt},
                                                                      {"3x", std::nullopt},
                                                                      {" 3", std::nullopt},
                                                                      {"0x3", std::nullopt},
                                                                      {"99999999999999999999", std::nullopt}};
  for (const auto& [text, expected] : rows) {
    const Variable variable("MARLET_DEFAULTS_ParserLogLevel", text);
    EXPECT_EQ(environment.userDefault("ParserLogLevel"), expected) << text;
  }
  const Variable variable("MARLET_DEFAULTS_A", "B=1");
  for (const std::string& key :
       {std::string("A=B"), std::string(), std::string("A\0", 2), std::string("None")}) {
    EXPECT_EQ(environment.userDefault(key), std::nullopt);
  }
}

TEST(HostEnvironment, AnEarlierOneStaysValid) {
  const auto& before = HostEnvironment::current();
  const auto documents = before.documentsDirectory;
  auto other = before;
  other.documentsDirectory = URL::file("/other", true);
  HostEnvironment::setCurrent(other);
  EXPECT_EQ(HostEnvironment::current().documentsDirectory, URL::file("/other", true));
  EXPECT_EQ(before.documentsDirectory, documents);
  HostEnvironment::setCurrent(before);
}

TEST(Host, ThreadsHaveTheNamesThatTheyWereGiven) {
  EXPECT_TRUE(isMainThread());
  std::thread([] {
    EXPECT_FALSE(isMainThread());
    EXPECT_EQ(currentThreadName(), "");
    setCurrentThreadName("a name of more than fifteen bytes");
    EXPECT_EQ(currentThreadName(), "a name of more than fifteen bytes");
  }).join();
  EXPECT_EQ(currentThreadName(), "");
}

TEST(Host, RandomUUIDs) {
  const std::regex form("[0-9A-F]{8}-[0-9A-F]{4}-4[0-9A-F]{3}-[89AB][0-9A-F]{3}-[0-9A-F]{12}");
  std::set<std::string> seen;
  for (int i = 0; i < 100; ++i) {
    const auto uuid = randomUUIDString();
    EXPECT_TRUE(std::regex_match(uuid, form)) << uuid;
    EXPECT_TRUE(seen.insert(uuid).second);
  }
}

TEST(Digest, MD5OfPieces) {
  MD5 digest;
  digest.update("message ");
  digest.update("");
  digest.update("digest");
  const std::array<std::uint8_t, 16> expected = {0xf9, 0x6b, 0x69, 0x7d, 0x7c, 0xb7, 0x93, 0x8d,
                                                 0x52, 0x5a, 0x2f, 0x31, 0xaa, 0xf1, 0x61, 0xd0};
  EXPECT_EQ(digest.final(), expected);
}

}  // namespace
}  // namespace MarletFoundation::test
