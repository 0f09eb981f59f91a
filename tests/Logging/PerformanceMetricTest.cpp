#include "MarletFoundation/Logging/PerformanceMetric.h"

#include <gtest/gtest.h>

#include <mutex>
#include <regex>
#include <thread>

#include "MarletFoundation/Logging/Log.h"
#include "MarletFoundation/Logging/PercentFormat.h"
#include "MarletFoundation/Utils/Continuation.h"
#include "support/FailingAllocation.h"

namespace MarletFoundation::test {
namespace {

struct Recorder final : Logger {
  std::vector<std::string> lines;
  void log(std::string_view message, const LogAspect&, LogLevel) override { lines.emplace_back(message); }
};

class PerformanceMetricTest : public testing::Test {
 protected:
  const std::shared_ptr<Recorder> recorder_ = std::make_shared<Recorder>();
  const LogAspect aspect_{"metrics", LogLevel::Normal, LogAspect::Loggers{recorder_}, false};
};

TEST_F(PerformanceMetricTest, ReportsEachCheckpointInItsOrder) {
  const auto metric = PerformanceMetricStart([] { return "Load 100%%"; }, aspect_, LogLevel::Normal);
  PerformanceMetricCheckpoint(metric, [] { return "Parsed"; });
  PerformanceMetricStop(metric, [] { return "2 pages"; });
  const char* expected[] = {
      R"(0\.\d{3} sec elapsed -- Load 100% completed\.)", "2 pages", R"(0\.000 sec, \+0\.000 sec -- start)",
      R"(0\.\d{3} sec, \+0\.\d{3} sec -- Parsed)", R"(0\.\d{3} sec, \+0\.\d{3} sec -- end)"};
  ASSERT_EQ(recorder_->lines.size(), std::size(expected));
  for (std::size_t i = 0; i < std::size(expected); ++i)
    EXPECT_TRUE(std::regex_match(recorder_->lines[i], std::regex(expected[i]))) << recorder_->lines[i];

  recorder_->lines.clear();
  PerformanceMetricStop(metric, false);
  EXPECT_TRUE(recorder_->lines.empty());
  metric->logPerformanceData();
  EXPECT_EQ(recorder_->lines.size(), 4u) << "the second stop has no result";
}

TEST_F(PerformanceMetricTest, LabelsTakeNoMoreThanTheTimesOfTheirLine) {
  const auto metric = PerformanceMetricStart([] { return "%f %n %s%"; }, aspect_, LogLevel::Normal);
  PerformanceMetricCheckpoint(metric, [] { return "%f%5.1f"; });
  PerformanceMetricStop(metric);
  EXPECT_TRUE(recorder_->lines[0].ends_with(" sec elapsed -- %f %n %s% completed.")) << recorder_->lines[0];
  EXPECT_TRUE(recorder_->lines[2].ends_with(" sec -- %f%5.1f")) << recorder_->lines[2];
}

TEST_F(PerformanceMetricTest, TakesTheTimeOfAContinuation) {
  const auto run = [&](const Continuation<int>& work) {
    return work.runWithPerformanceMetrics([] { return "Work"; }, aspect_, LogLevel::Normal);
  };
  EXPECT_EQ(run(Continuation<int>([] { return 7; })), 7);
  EXPECT_EQ(recorder_->lines.size(), 3u);
  EXPECT_EQ(run(Continuation<int>::fail()), std::nullopt);
  EXPECT_EQ(recorder_->lines.size(), 6u);
}

TEST_F(PerformanceMetricTest, ReportsNothingThatWasNeverStarted) {
  const auto metric = PerformanceMetric::make(
      aspect_, LogLevel::Normal, [] { return "idle"; }, false);
  PerformanceMetricStop(metric);
  metric->logPerformanceData();
  EXPECT_TRUE(recorder_->lines.empty());
}

TEST_F(PerformanceMetricTest, IsFoundByItsIdentifierUntilItGivesItUp) {
  const auto metric = PerformanceMetricStart([] { return "job"; }, aspect_, LogLevel::Normal);
  metric->setIdentifier("first");
  EXPECT_EQ(PerformanceMetric::performanceMetricWithIdentifier("first"), metric);
  metric->setIdentifier("second");
  EXPECT_EQ(PerformanceMetric::performanceMetricWithIdentifier("first"), nullptr);
  EXPECT_EQ(PerformanceMetric::performanceMetricWithIdentifier("second"), metric);
  metric->setIdentifier(std::nullopt);
  EXPECT_EQ(PerformanceMetric::performanceMetricWithIdentifier("second"), nullptr);
}

TEST_F(PerformanceMetricTest, KeepsTheOrderOfEachThreadsCheckpoints) {
  const auto metric = PerformanceMetricStart([] { return "job"; }, aspect_, LogLevel::Normal);
  std::vector<std::thread> threads;
  for (const char name : {'a', 'b', 'c'}) {
    threads.emplace_back([&metric, name] {
      for (char i = '0'; i <= '9'; ++i)
        PerformanceMetricCheckpoint(metric, [&] { return std::string{name, i}; });
    });
  }
  for (auto& thread : threads) thread.join();
  PerformanceMetricStop(metric);
  for (const char name : {'a', 'b', 'c'}) {
    std::string order;
    for (const auto& line : recorder_->lines) {
      if (line[line.size() - 2] == name) order += line.back();
    }
    EXPECT_EQ(order, "0123456789");
  }
}

TEST_F(PerformanceMetricTest, WhatIsDroppedAllocatesNothing) {
  const std::string longLabel(100, 'x');
  int evaluated = 0;
  const auto label = [&] {
    ++evaluated;
    return longLabel;
  };
  takeAllocationCount();
  const auto metric = PerformanceMetricStart(label, aspect_, LogLevel::Verbose);
  PerformanceMetricCheckpoint(metric, label);
  PerformanceMetricStop(metric, label);
  Log(label, aspect_, LogLevel::Verbose);
  EXPECT_EQ(takeAllocationCount(), 0);
  EXPECT_EQ(metric, nullptr);
  EXPECT_EQ(evaluated, 0);
}

TEST(PercentFormat, TakesNumbersAndLeavesTheRest) {
  const std::vector<double> numbers{1.5, -2.25};
  const std::pair<const char*, const char*> cases[] = {
      {"", ""},
      {"%3.3f sec, +%3.3f sec", "1.500 sec, +-2.250 sec"},
      {"%f%%%f", "1.500000%-2.250000"},
      {"%08.2f|%-8.1f|", "00001.50|-2.2    |"},
      {"%+.0e % G", "+2e+00 -2.25"},
      {"%f %f %f %f", "1.500000 -2.250000 %f %f"},
      {"%", "%"},
      {"100% of %s %d %n %1$f %*f %lf %.f", "100% of %s %d %n %1$f %*f %lf 2"},
      {"%9999f %.9999f", "%9999f %.9999f"},
  };
  for (const auto& [format, expected] : cases)
    EXPECT_EQ(percentFormatted(format, numbers), expected) << format;
  EXPECT_EQ(percentFormatted("%f", {}), "%f");
}

}  // namespace
}  // namespace MarletFoundation::test
