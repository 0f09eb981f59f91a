#include "MarletFoundation/Logging/PerformanceMetric.h"

#include <map>

#include "MarletFoundation/Logging/Log.h"
#include "MarletFoundation/Logging/PercentFormat.h"

namespace MarletFoundation {
namespace {

auto& registeredPerformanceMetrics() {
  // Never destroyed: metrics may be stopped until the very end of the process.
  static auto& metrics = *new std::map<std::string, std::shared_ptr<PerformanceMetric>, std::less<>>;
  return metrics;
}

double seconds(const Date& from, const Date& to) {
  return to.secondsSinceReferenceDate - from.secondsSinceReferenceDate;
}

}  // namespace

std::shared_ptr<PerformanceMetric> PerformanceMetric::made(const LogAspect& logAspect, LogLevel logLevel,
                                                           std::string label, bool start) {
  const std::shared_ptr<PerformanceMetric> metric(
      new PerformanceMetric(logAspect, logLevel, std::move(label)));
  if (start) metric->dataLock_.asyncLock([metric, now = Date::now()] { metric->startTime_ = now; });
  return metric;
}

std::shared_ptr<PerformanceMetric> PerformanceMetric::performanceMetricWithIdentifier(
    std::string_view identifier) {
  const auto& metrics = registeredPerformanceMetrics();
  const auto found = metrics.find(identifier);
  return found == metrics.end() ? nullptr : found->second;
}

void PerformanceMetric::setIdentifier(std::optional<std::string> identifier) {
  auto& metrics = registeredPerformanceMetrics();
  const auto self = shared_from_this();
  if (identifier_) {
    // Another metric may have taken the name since.
    const auto old = metrics.find(*identifier_);
    if (old != metrics.end() && old->second == self) metrics.erase(old);
  }
  identifier_ = std::move(identifier);
  if (identifier_) metrics.insert_or_assign(*identifier_, self);
}

void PerformanceMetric::_checkpoint(std::string label) {
  dataLock_.asyncLock(
      [self = shared_from_this(), checkpoint = Checkpoint{std::move(label), Date::now()}]() mutable {
        self->checkpoints_.push_back(std::move(checkpoint));
      });
}

void PerformanceMetric::_stop(std::optional<std::string> result, bool logImmediately) {
  const auto now = Date::now();
  dataLock_.lock([&] {
    endTime_ = now;
    result_ = std::move(result);
    if (logImmediately && startTime_) report();
  });
}

void PerformanceMetric::logPerformanceData() {
  dataLock_.lock([this] { report(); });
}

void PerformanceMetric::report() const {
  if (!startTime_ || !endTime_) return;
  logLine("%3.3f sec elapsed -- " + label_ + " completed.", {seconds(*startTime_, *endTime_)});
  if (result_) Log([this] { return std::string_view(*result_); }, logAspect_, logLevel_);
  auto previous = *startTime_;
  const auto logCheckpoint = [&](std::string_view label, const Date& time) {
    logLine("%3.3f sec, +%3.3f sec -- " + std::string(label),
            {seconds(*startTime_, time), seconds(previous, time)});
    previous = time;
  };
  logCheckpoint("start", *startTime_);
  for (const auto& checkpoint : checkpoints_) logCheckpoint(checkpoint.label, checkpoint.time);
  logCheckpoint("end", *endTime_);
}

void PerformanceMetric::logLine(std::string_view format, std::initializer_list<double> times) const {
  Log([&] { return percentFormatted(format, {times.begin(), times.size()}); }, logAspect_, logLevel_);
}

}  // namespace MarletFoundation
