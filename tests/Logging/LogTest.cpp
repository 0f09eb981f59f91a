#include "MarletFoundation/Logging/Log.h"

#include <gtest/gtest.h>
#include <rapidcheck/gtest.h>

#include <mutex>
#include <thread>

#include "MarletFoundation/Logging/SystemLog.h"
#include "MarletFoundation/Platform/Host.h"
#include "MarletFoundation/Platform/HostEnvironment.h"
#include "MarletFoundation/Platform/Text.h"
#include "support/ChangedHost.h"
#include "support/Fatal.h"

namespace MarletFoundation::test {
namespace {

class Log : public testing::Test {
 protected:
  std::vector<std::string> entries;
  std::map<std::string, std::int64_t, std::less<>> defaults;
  const ChangedHost host{[this](HostEnvironment& environment) {
    environment.systemLog = [this](std::string_view entry) { entries.emplace_back(entry); };
    environment.userDefault = [this](std::string_view key) -> std::optional<std::int64_t> {
      const auto found = defaults.find(key);
      return found == defaults.end() ? std::nullopt : std::optional(found->second);
    };
  }};
};

struct Recorder final : Logger {
  std::vector<std::string> lines;
  void log(std::string_view message, const LogAspect& logAspect, LogLevel logLevel) override {
    lines.push_back(logAspect.name + "/" + std::string(description(logLevel)) + "/" + std::string(message));
  }
};

TEST_F(Log, LevelsComeFromTheUserDefaultOnce) {
  const std::tuple<const char*, std::optional<std::int64_t>, LogLevel> cases[] = {
      {"Missing", std::nullopt, LogLevel::Critical},
      {"Zero", 0, LogLevel::Critical},
      {"Negative", -5, LogLevel::Critical},
      {"One", 1, LogLevel::Critical},
      {"Two", 2, LogLevel::Normal},
      {"Three", 3, LogLevel::Verbose},
      {"Huge", INT64_MAX, LogLevel::Verbose},
      {"Tiny", INT64_MIN, LogLevel::Critical},
  };
  for (const auto& [name, value, level] : cases) {
    const auto key = std::string(name) + "LogLevel";
    if (value) defaults[key] = *value;
    EXPECT_EQ(LogAspect(name).activeLevel, level) << name;
    defaults[key] = value == 3 ? 1 : 3;
    EXPECT_EQ(LogAspect(name).activeLevel, level) << name << " must stay as registered";
  }
}

TEST_F(Log, RegisteringReplacesAndNotRegisteringDoesnt) {
  LogAspect("Registered");
  const LogAspect unregistered("Registered", LogLevel::Verbose, false);
  EXPECT_EQ(LogAspect("Registered").activeLevel, LogLevel::Critical);
  const LogAspect registered("Registered", LogLevel::Normal, LogAspect::Loggers(), true);
  EXPECT_EQ(LogAspect("Registered").activeLevel, LogLevel::Normal);
  EXPECT_TRUE(LogAspect("Registered").loggers);

  int asked = 0;
  const ChangedHost asking([&](HostEnvironment& environment) {
    environment.userDefault = [&](std::string_view) {
      ++asked;
      LogAspect("Meanwhile", LogLevel::Verbose, true);
      return std::nullopt;
    };
  });
  for (int round = 0; round < 2; ++round)
    EXPECT_EQ(LogAspect("Meanwhile").activeLevel, LogLevel::Verbose) << "registered while the host was asked";
  EXPECT_EQ(asked, 1);
}

TEST_F(Log, AMessageIsMadeOnlyWhenItsLevelPasses) {
  constexpr LogLevel levels[] = {LogLevel::Critical, LogLevel::Normal, LogLevel::Verbose};
  for (const auto active : levels) {
    for (const auto level : levels) {
      const auto first = std::make_shared<Recorder>(), second = std::make_shared<Recorder>();
      int made = 0;
      const auto message = [&] { return "m" + std::to_string(++made); };
      MarletFoundation::Log(message, LogAspect("A", active, LogAspect::Loggers{first, second}, false), level);
      const bool passes = static_cast<int>(level) <= static_cast<int>(active);
      EXPECT_EQ(made, passes);
      std::vector<std::string> expected;
      if (passes) expected.push_back("A/" + std::string(description(level)) + "/m1");
      EXPECT_EQ(first->lines, expected);
      EXPECT_EQ(second->lines, expected);
    }
  }
  int made = 0;
  const LogAspect nobody("Nobody", LogLevel::Critical, LogAspect::Loggers(), false);
  MarletFoundation::Log([&] { return std::to_string(++made); }, nobody, LogLevel::Critical);
  EXPECT_EQ(made, 1);
  EXPECT_TRUE(entries.empty());
}

TEST_F(Log, TheConsoleLineBeginsWithTheThread) {
  const LogAspect aspect("Parser", LogLevel::Critical, false);
  const auto logLoaded = [&] { MarletFoundation::Log([] { return "Loaded"; }, aspect, LogLevel::Critical); };
  logLoaded();
  std::thread(logLoaded).join();
  std::thread([&] {
    setCurrentThreadName("worker");
    logLoaded();
  }).join();
  EXPECT_EQ(entries, (std::vector<std::string>{"[MT] Parser: Loaded", "[?T] Parser: Loaded",
                                               "worker Parser: Loaded"}));
}

TEST_F(Log, LongLinesAreSplitPrefixIncluded) {
  const LogAspect aspect("P", LogLevel::Critical, false);
  const std::string prefix = "[MT] P: ";
  MarletFoundation::Log([&] { return std::string(200 - prefix.size(), 'x'); }, aspect, LogLevel::Critical);
  EXPECT_EQ(entries, std::vector{prefix + std::string(200 - prefix.size(), 'x')});
  entries.clear();
  log(std::string(200, 'x') + "y");
  EXPECT_EQ(entries, (std::vector<std::string>{std::string(200, 'x'), "TRUNCATED: y"}));
  entries.clear();
  log("");
  EXPECT_TRUE(entries.empty());
  warning();
  warning("nothing comes of it");
  EXPECT_EQ(fatalMessage([] { SystemLog("%s", "x"); }), "do not call this function");
  EXPECT_TRUE(entries.empty());
}

TEST(LogSplit, CountsUserPerceivedCharacters) {
  const std::string family = "\U0001F468\u200D\U0001F469\u200D\U0001F467";
  const std::string accented = "e\u0301";
  const auto split = ___breakLogStringUpForTruncationWorkaround;
  const std::tuple<std::string, int, std::vector<std::string>> cases[] = {
      {"", 2, {}},
      {"ab", 2, {"ab"}},
      {"abc", 2, {"ab", "TRUNCATED: c"}},
      {"abcd", 1, {"a", "TRUNCATED: b", "TRUNCATED: c", "TRUNCATED: d"}},
      {accented + "x" + accented, 2, {accented + "x", "TRUNCATED: " + accented}},
      {family + family, 1, {family, "TRUNCATED: " + family}},
      {"\r\n\r\n", 1, {"\r\n", "TRUNCATED: \r\n"}},
  };
  for (const auto& [text, length, entries] : cases) EXPECT_EQ(split(text, length), entries) << quoted(text);
  EXPECT_NE(fatalMessage([&] { split("x", 0); }), "");
}

RC_GTEST_PROP(LogSplit, EntriesJoinToTheTextAndAllButTheLastAreFull, ()) {
  static const char* const pieces[] = {"a",          "\n",     "\r",         "e",   "\u0301",
                                       "\U0001F468", "\u200D", "\U0001F1EB", "\xFF"};
  std::string text;
  for (const int i : *rc::gen::container<std::vector<int>>(rc::gen::inRange(0, 9))) text += pieces[i];
  const auto length = *rc::gen::inRange(1, 6);
  const auto entries = ___breakLogStringUpForTruncationWorkaround(text, length);
  std::string joined;
  for (std::size_t i = 0; i < entries.size(); ++i) {
    const auto run = std::string_view(entries[i]).substr(i == 0 ? 0 : 11);
    RC_ASSERT(!run.empty());
    joined += run;
    RC_ASSERT(i + 1 == entries.size() ||
              graphemeRunEnd(text, joined.size() - run.size(), length) == joined.size());
  }
  RC_ASSERT(joined == text);
}

TEST(LogSplit, ALongTextIsWalkedOnce) {
  // Walking from the start for every entry would take minutes.
  std::string text;
  while (text.size() < 2'000'000) text += "e\u0301";
  EXPECT_EQ(___breakLogStringUpForTruncationWorkaround(text, 200).size(), 3334u);
}

}  // namespace
}  // namespace MarletFoundation::test
