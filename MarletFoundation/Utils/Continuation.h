#pragma once

#include <concepts>
#include <functional>
#include <memory>
#include <optional>
#include <vector>

#include "MarletFoundation/Data/Unit.h"
#include "MarletFoundation/Logging/PerformanceMetric.h"
#include "MarletFoundation/Platform/DispatchQueue.h"

namespace MarletFoundation {

/// Work for later that yields a `T`, or nothing where it fails. Nothing runs before `run`, and each run runs
/// the work anew. Of `Unit`, it is work without a result.
template <class T>
class Continuation {
 public:
  /// Work that can't fail.
  explicit Continuation(std::function<T()> f) : f_(std::make_shared<const Work>(std::move(f))) {}
  /// Work that always fails.
  static Continuation fail() { return Continuation(); }
  /// Work whose next stage is made when it runs; no next stage is a failure.
  static Continuation failable(std::function<std::optional<Continuation>()> stage) {
    Continuation continuation;
    continuation.failable_ = std::make_shared<const Stage>(std::move(stage));
    return continuation;
  }

  static Continuation nothing() requires std::same_as<T, Unit> {
    return Continuation([] { return Unit(); });
  }
  /// When run, has `f` called and what it yields run on the global queue, and doesn't wait for it.
  static Continuation background(std::function<Continuation()> f) requires std::same_as<T, Unit> {
    return onQueue(DispatchQueue::global(), std::move(f));
  }
  /// The same on the main queue, whose blocks run as the host pumps them (`runUntil`).
  static Continuation mainAsync(std::function<Continuation()> f) requires std::same_as<T, Unit> {
    return onQueue(DispatchQueue::main(), std::move(f));
  }

  /// Runs on this thread. Stages that follow each other take no stack.
  std::optional<T> run() const {
    auto current = *this;
    while (!current.f_) {
      if (!current.failable_) return std::nullopt;
      auto next = (*current.failable_)();
      if (!next) return std::nullopt;
      current = *std::move(next);
    }
    return (*current.f_)();
  }

  /// This work, and behind it what `g` makes of its value.
  template <class G>
  std::invoke_result_t<G&, T> flatMap(G g) const {
    using Next = std::invoke_result_t<G&, T>;
    return Next::failable([self = *this, g = std::move(g)]() mutable -> std::optional<Next> {
      auto value = self.run();
      if (!value) return std::nullopt;
      return g(*std::move(value));
    });
  }

  /// `run` between the start and the stop of a metric.
  template <DeferredString Label>
  std::optional<T> runWithPerformanceMetrics(Label&& label, const LogAspect& aspect,
                                             LogLevel logLevel) const {
    const auto metric = PerformanceMetricStart(std::forward<Label>(label), aspect, logLevel);
    auto value = run();
    PerformanceMetricStop(metric);
    return value;
  }

 private:
  using Work = std::function<T()>;
  using Stage = std::function<std::optional<Continuation>()>;

  Continuation() = default;

  static Continuation onQueue(const DispatchQueue& queue, std::function<Continuation()> f) {
    return Continuation([queue, f = std::move(f)] {
      queue.async([f] { f().run(); });
      return Unit();
    });
  }

  // At most one is there. Copies share it, so that a long chain is as cheap to copy as a short one.
  std::shared_ptr<const Work> f_;
  std::shared_ptr<const Stage> failable_;
};

/// Runs all in order on one thread, up to the first that fails, and yields their values.
template <class T>
Continuation<std::vector<T>> sequence(std::vector<Continuation<T>> continuations) {
  using Values = Continuation<std::vector<T>>;
  return Values::failable([continuations = std::move(continuations)]() -> std::optional<Values> {
    std::vector<T> values;
    values.reserve(continuations.size());
    for (const auto& continuation : continuations) {
      auto value = continuation.run();
      if (!value) return std::nullopt;
      values.push_back(*std::move(value));
    }
    return Values([values = std::move(values)] { return values; });
  });
}

/// The same without the values.
template <class T>
Continuation<Unit> sequence_(std::vector<Continuation<T>> continuations) {
  return Continuation<Unit>::failable(
      [continuations = std::move(continuations)]() -> std::optional<Continuation<Unit>> {
        for (const auto& continuation : continuations)
          if (!continuation.run()) return std::nullopt;
        return Continuation<Unit>::nothing();
      });
}

/// A function of no arguments that yields a continuation to be run next.
template <class F>
concept YieldsContinuation = std::convertible_to<std::invoke_result_t<F&>, Continuation<Unit>>;

/// Has `f` called on the global queue, and the continuation run that it may yield; returns at once.
template <std::invocable F>
void asyncio(F f) {
  if constexpr (YieldsContinuation<F>)
    Continuation<Unit>::background(std::move(f)).run();
  else
    DispatchQueue::global().async(std::move(f));
}
/// The same on the main queue.
template <std::invocable F>
void mainthreadio(F f) {
  if constexpr (YieldsContinuation<F>)
    Continuation<Unit>::mainAsync(std::move(f)).run();
  else
    DispatchQueue::main().async(std::move(f));
}

}  // namespace MarletFoundation
