#include "MarletFoundation/Logging/ActivityTracer.h"

#include <fcntl.h>
#include <gtest/gtest.h>
#include <sys/file.h>
#include <sys/stat.h>
#include <unistd.h>

#include <filesystem>
#include <fstream>
#include <regex>
#include <sstream>

#include "MarletFoundation/Logging/UserDefaultBoolKey.h"
#include "MarletFoundation/Platform/HostEnvironment.h"
#include "support/ChangedHost.h"
#include "support/Failure.h"
#include "support/Tree.h"

namespace MarletFoundation::test {
namespace {

using Event = ActivityTracingEvent;

// On the stack, a tracer would lose its typed events.
static_assert(!std::is_default_constructible_v<ActivityTracer> &&
              !std::is_copy_constructible_v<ActivityTracer>);

class ActivityTracerTest : public testing::Test {
 protected:
  std::vector<std::string> lines(const char* name) const {
    std::ifstream file(directory_.path() / "support" / name);
    std::vector<std::string> lines;
    for (std::string line; std::getline(file, line);) lines.push_back(line);
    return lines;
  }
  void finish() const {
    // What a block queues runs behind it.
    for (int round = 0; round < 3; ++round) tracer_->loggingQueue.sync([] {});
  }

  const TemporaryDirectory directory_;
  std::string logged_;
  const ChangedHost host_{[this](HostEnvironment& host) {
    host.applicationSupportDirectory = directory_.url("support");
    host.systemLog = [this](std::string_view entry) { logged_ += std::string(entry) + "\n"; };
    host.userDefault = [](std::string_view key) {
      return key == "Known" ? std::optional<std::int64_t>(1) : std::nullopt;
    };
  }};
  const std::shared_ptr<ActivityTracer> tracer_ = ActivityTracer::make();
};

TEST_F(ActivityTracerTest, WritesALineForEachEvent) {
  tracer_->traceEvent("Opened",
                      {{"page", std::make_shared<StringObject>("One")}, {"count", NumberObject::integer(2)}});
  tracer_->traceEvent("Failed", {{"when", std::make_shared<DateObject>(Date{})}});
  tracer_->traceEvent("Bare", {});
  finish();
  const auto log = lines("activity.log");
  const char* expected[] = {R"(Opened \{"count":2,"page":"One"\})", "Failed <Error Serializing JSON>",
                            R"(Bare \{\})"};
  ASSERT_EQ(log.size(), 3u);
  for (std::size_t i = 0; i < 3; ++i) {
    const std::regex form(std::string(R"(\[\d{4}-\d\d-\d\d \d\d:\d\d:\d\d \+0000\] )") + expected[i]);
    EXPECT_TRUE(std::regex_match(log[i], form)) << log[i];
  }
}

TEST_F(ActivityTracerTest, SpoolsTypedEvents) {
  tracer_->traceTelvaneEvent({Event::Category::page, Event::EventType::suggestionTapped, {}});
  tracer_->traceTelvaneEvent(
      {Event::Category::keyboard, Event::EventType::hidden, {{"bad", std::make_shared<DateObject>(Date{})}}});
  tracer_->traceTelvaneEvent(
      {Event::Category::document, Event::EventType::reset, {{"n", NumberObject::real(1.5)}}});
  finish();
  const auto messages = lines("TelvaneReporting/Messages.jsonl");
  ASSERT_EQ(messages.size(), 3u);
  EXPECT_EQ(messages[0].find(R"({"session":{"batchEvent":"true","clientType":"MarletFoundation",)"), 0u)
      << messages[0];
  EXPECT_EQ(messages[1], R"({"category":1,"type":10,"payload":{}})");
  EXPECT_EQ(messages[2], R"({"category":2,"type":3,"payload":{"n":1.5}})");
  EXPECT_EQ(logged_, "Telvane Error, dropping log message\n");
  EXPECT_TRUE(tracer_->reporterEnabled());
}

TEST_F(ActivityTracerTest, TriesAgainWhereNoReporterCouldBeSetUp) {
  const auto support = directory_.path() / "support";
  std::ofstream(support) << "in the way";
  tracer_->traceTelvaneEvent({Event::Category::page, Event::EventType::opened, {}});
  finish();
  EXPECT_EQ(logged_, "Telvane Error, dropping log message\nError setting up Telvane!\n");
  EXPECT_FALSE(tracer_->reporterEnabled());
  std::filesystem::remove(support);
  tracer_->traceTelvaneEvent({Event::Category::page, Event::EventType::closed, {}});
  finish();
  EXPECT_EQ(lines("TelvaneReporting/Messages.jsonl").size(), 2u);
}

/// Whatever stands in a file's place, and whoever holds the lock: the queue goes on, and traces again afterwards.
TEST_F(ActivityTracerTest, NothingInTheWayHoldsUpTheQueue) {
  const auto support = directory_.path() / "support";
  const auto trace = [&] {
    logged_.clear();
    for (int time = 0; time < 2; ++time) {
      tracer_->traceEvent("Opened", {});
      tracer_->traceTelvaneEvent({Event::Category::page, Event::EventType::opened, {}});
    }
    finish();
  };
  const auto contains = [&](const char* words) { return logged_.find(words) != std::string::npos; };
  trace();
  EXPECT_EQ(logged_, "");
  for (const std::string name :
       {"activity.log", "TelvaneReporting/Messages.jsonl", "TelvaneReporting/Lock"}) {
    const auto place = support / name, kept = directory_.path() / "kept";
    const std::pair<const char*, std::function<void()>> hindrances[] = {
        {"pipe", [&] { ::mkfifo(place.c_str(), 0600); }},
        {"link to a pipe",
         [&] { ::mkfifo(kept.c_str(), 0600), std::filesystem::create_symlink(kept, place); }},
        {"link to a file", [&] { std::ofstream{kept}, std::filesystem::create_symlink(kept, place); }},
        {"directory", [&] { std::filesystem::create_directory(place); }},
    };
    for (const auto& [hindrance, put] : hindrances) {
      std::filesystem::remove(place);
      put();
      trace();
      EXPECT_EQ(contains("Activity tracing is off: "), name == "activity.log") << hindrance << logged_;
      EXPECT_EQ(contains("Telvane Error, dropping log message"), name != "activity.log") << hindrance << name;
      // Said once, not for each event.
      EXPECT_EQ(logged_.find("Activity", logged_.find("Activity") + 1), std::string::npos) << logged_;
      std::filesystem::remove(place);
      std::filesystem::remove(kept);
      trace();
      EXPECT_EQ(logged_, "") << hindrance << name;
    }
  }
  {
    const int lock = ::open((support / "TelvaneReporting/Lock").c_str(), O_RDWR | O_CLOEXEC);
    ASSERT_EQ(::flock(lock, LOCK_EX), 0);
    trace();
    ::close(lock);
    EXPECT_TRUE(contains("Telvane Error, dropping log message"));
  }
  trace();
  EXPECT_EQ(logged_, "");
  std::filesystem::remove_all(support);
  std::ofstream(support) << "no directory can be made";
  trace();
  EXPECT_TRUE(contains("Activity tracing is off: ")) << logged_;
}

TEST_F(ActivityTracerTest, SpoolStaysBounded) {
  MLFReporting reporting;
  std::vector<std::string> parts;
  reporting.startConfiguration([&](const auto& results) { parts = results; });
  EXPECT_EQ(parts, (std::vector<std::string>{"spool", "framework MarletFoundation"}));
  std::optional<ErrorObject> failure;
  const auto flush = [&] { reporting.flushMessages([&](const auto& error) { failure = error; }); };
  flush();
  EXPECT_FALSE(failure);
  for (int i = 0; i < 5; ++i) reporting.sendMessage(1, 1, StringObject(std::string(300000, 'x')));
  const auto spool = directory_.path() / "support/TelvaneReporting";
  EXPECT_LE(std::filesystem::file_size(spool / "Messages.jsonl"), 1u << 20);
  EXPECT_LE(std::filesystem::file_size(spool / "Messages.old.jsonl"), 1u << 20);
  EXPECT_EQ(
      lines("TelvaneReporting/Messages.jsonl").size() + lines("TelvaneReporting/Messages.old.jsonl").size(),
      6u);
  std::filesystem::remove(spool / "Messages.jsonl");
  std::filesystem::create_directory(spool / "Messages.jsonl");
  flush();
  ASSERT_TRUE(failure);
  EXPECT_EQ(failure->code(), EISDIR);
  reporting.finishSession();
  EXPECT_EQ(thrown<ErrorObject>([&] { reporting.sendMessage(1, 1, StringObject("x")); }).domain(),
            "TelvaneReporting");
}

TEST_F(ActivityTracerTest, IdentifiersPersistUntilRegenerated) {
  const auto first = MLFReporting::persistentIdentifierForDNU("a");
  EXPECT_EQ(MLFReporting::persistentIdentifierForDNU("a"), first);
  EXPECT_NE(MLFReporting::persistentIdentifierForDNU("b"), first);
  const auto second = MLFReporting::regeneratePersistentIdentifierForDNU("a");
  EXPECT_NE(second, first);
  EXPECT_EQ(MLFReporting::persistentIdentifierForDNU("a"), second);
}

TEST_F(ActivityTracerTest, RawValuesAndDefaults) {
  EXPECT_FALSE(Event::categoryFromRawValue(0));
  EXPECT_EQ(Event::categoryFromRawValue(3), Event::Category::keyboard);
  EXPECT_FALSE(Event::categoryFromRawValue(4));
  EXPECT_FALSE(Event::eventTypeFromRawValue(0));
  EXPECT_EQ(Event::eventTypeFromRawValue(6), Event::EventType::hintAccessed);
  EXPECT_FALSE(Event::eventTypeFromRawValue(11));

  EXPECT_TRUE(UserDefaultBoolKey("Known", false).isEnabled);
  EXPECT_TRUE(UserDefaultBoolKey("Unknown", true).isEnabled);
  UserDefaults::registerDefault("Unknown", false);
  EXPECT_FALSE(UserDefaults::boolean("Unknown"));
}

}  // namespace
}  // namespace MarletFoundation::test
