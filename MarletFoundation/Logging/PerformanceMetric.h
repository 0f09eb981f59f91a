#pragma once

#include <concepts>
#include <functional>
#include <memory>
#include <optional>
#include <string>
#include <vector>

#include "MarletFoundation/Logging/LogAspect.h"
#include "MarletFoundation/Platform/Date.h"
#include "MarletFoundation/Utils/Locks.h"

namespace MarletFoundation {

/// A deferred text: a function of no arguments that is called only when the text is needed.
template <class F>
concept DeferredString = std::invocable<F> && std::convertible_to<std::invoke_result_t<F>, std::string>;

/// A stopwatch with named checkpoints that reports to a `LogAspect`. A metric whose report would be dropped
/// isn't made at all, and the free functions below do nothing for an absent one. They may be called on any
/// thread.
///
/// A report says "1.500 sec elapsed -- LABEL completed.", the result if there is one, and for the start, each
/// checkpoint and the end "1.000 sec, +0.400 sec -- LABEL": the time since the start and since the line
/// before. A label is a part of the line's format: "%%" in it is one percent sign, and "%f" takes a time that
/// the line has left.
class MARLET_EXPORT PerformanceMetric : public std::enable_shared_from_this<PerformanceMetric> {
 public:
  /// Null, without a call of `label`, when `logAspect` drops `logLevel`. Begins to run if `start` is true.
  template <DeferredString Label>
  static std::shared_ptr<PerformanceMetric> make(const LogAspect& logAspect, LogLevel logLevel, Label&& label,
                                                 bool start) {
    if (logAspect.activeLevel < logLevel) return nullptr;
    return made(logAspect, logLevel, std::invoke(label), start);
  }
  /// The metric that was given this identifier, or null.
  static std::shared_ptr<PerformanceMetric> performanceMetricWithIdentifier(std::string_view identifier);

  const LogAspect& logAspect() const { return logAspect_; }
  LogLevel logLevel() const { return logLevel_; }
  const std::string& label() const { return label_; }

  /// The name under which another stage of a job finds the metric, which is kept alive by it. A new name takes
  /// the place of the old one; an absent one gives the metric up. Set and looked up on one thread only.
  const std::optional<std::string>& identifier() const { return identifier_; }
  void setIdentifier(std::optional<std::string> identifier);

  /// The time is taken now, and recorded soon: the caller doesn't wait for a report.
  void _checkpoint(std::string label);
  /// Sets end and result, again if it was stopped before. `logImmediately` makes the report of a metric that
  /// was started.
  void _stop(std::optional<std::string> result, bool logImmediately);
  /// Makes the report, if the metric was started and stopped.
  void logPerformanceData();

 private:
  struct Checkpoint {
    std::string label;
    Date time;
  };

  PerformanceMetric(const LogAspect& logAspect, LogLevel logLevel, std::string label)
      : logAspect_(logAspect), logLevel_(logLevel), label_(std::move(label)) {}

  static std::shared_ptr<PerformanceMetric> made(const LogAspect& logAspect, LogLevel logLevel,
                                                 std::string label, bool start);
  void report() const;
  void logLine(std::string_view format, std::initializer_list<double> times) const;

  const LogAspect logAspect_;
  const LogLevel logLevel_;
  const std::string label_;
  std::optional<std::string> identifier_;
  DispatchLock dataLock_{"PerformanceMetric data lock"};
  // All below are touched under the lock only.
  std::optional<Date> startTime_;
  std::optional<Date> endTime_;
  std::vector<Checkpoint> checkpoints_;
  std::optional<std::string> result_;
};

/// A running metric, or null.
template <DeferredString Label>
std::shared_ptr<PerformanceMetric> PerformanceMetricStart(Label&& label, const LogAspect& logAspect,
                                                          LogLevel logLevel) {
  return PerformanceMetric::make(logAspect, logLevel, std::forward<Label>(label), true);
}

template <DeferredString Label>
void PerformanceMetricCheckpoint(const std::shared_ptr<PerformanceMetric>& metric, Label&& label) {
  if (metric) metric->_checkpoint(std::invoke(label));
}

/// `result` is a function of no arguments that yields a text, or an optional one.
template <std::invocable Result>
void PerformanceMetricStop(const std::shared_ptr<PerformanceMetric>& metric, Result&& result,
                           bool logImmediately = true) {
  if (metric) metric->_stop(std::invoke(result), logImmediately);
}
inline void PerformanceMetricStop(const std::shared_ptr<PerformanceMetric>& metric,
                                  bool logImmediately = true) {
  if (metric) metric->_stop(std::nullopt, logImmediately);
}

}  // namespace MarletFoundation
