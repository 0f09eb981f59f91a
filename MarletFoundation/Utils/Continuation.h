#pragma once

#include <concepts>
#include <functional>
#include <memory>
#include <optional>
#include <vector>

#include "MarletFoundation/Data/Unit.h"
#include "MarletFoundation/Logging/PerformanceMetric.h"
#include "MarletFoundation/Platform/DispatchQueue.h"
#include "MarletFoundation/Utils/ContinuationPart.h"

namespace MarletFoundation {

/// Work for later that yields a `T`, or nothing where it fails. Nothing runs before `run`, and each run runs
/// the work anew. Of `Unit`, it is work without a result.
template <class T>
class Continuation {
 public:
  /// Work that can't fail.
  explicit Continuation(std::function<T()> f) : part_(std::make_shared<const Work>(std::move(f))) {}
  Continuation(const Continuation&) = default;
  Continuation(Continuation&&) noexcept = default;
  Continuation& operator=(const Continuation&) = default;
  Continuation& operator=(Continuation&&) noexcept = default;
  ~Continuation() { releaseWithoutStack(std::move(part_)); }

  /// Work that always fails.
  static Continuation fail() { return Continuation(ContinuationPart::Link()); }
  /// Work whose next stage is made when it runs; no next stage is a failure.
  static Continuation failable(std::function<std::optional<Continuation>()> stage) {
    return Continuation(std::make_shared<const Stage>(std::move(stage)));
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

  /// Runs on this thread. Work that is chained takes no stack, however long the chain is.
  std::optional<T> run() const {
    const auto value = ContinuationPart::run(part_);
    if (!value) return std::nullopt;
    return std::move(*static_cast<T*>(value.get()));
  }

  /// This work, and behind it what `g` makes of its value.
  template <class G>
  std::invoke_result_t<G&, T> flatMap(G g) const {
    using Next = std::invoke_result_t<G&, T>;
    if (!part_) return Next::fail();
    return Next(std::make_shared<const Chained<G>>(part_, std::move(g)));
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
  template <class>
  friend class Continuation;

  struct Work final : ContinuationPart {
    explicit Work(std::function<T()> function) : f(std::move(function)) {}
    Outcome proceed(void*) const override { return {std::make_shared<T>(f()), nullptr}; }
    const std::function<T()> f;
  };
  struct Stage final : ContinuationPart {
    explicit Stage(std::function<std::optional<Continuation>()> function) : f(std::move(function)) {}
    Outcome proceed(void*) const override {
      const auto next = f();
      return {nullptr, next ? next->part_ : nullptr};
    }
    const std::function<std::optional<Continuation>()> f;
  };
  template <class G>
  struct Chained final : ContinuationPart {
    Chained(Link prior, G function) : ContinuationPart(std::move(prior)), g(std::move(function)) {}
    Outcome proceed(void* value) const override {
      return {nullptr, g(std::move(*static_cast<T*>(value))).part_};
    }
    mutable G g;
  };

  explicit Continuation(ContinuationPart::Link part) : part_(std::move(part)) {}

  static Continuation onQueue(const DispatchQueue& queue, std::function<Continuation()> f) {
    return Continuation([queue, f = std::move(f)] {
      queue.async([f] { f().run(); });
      return Unit();
    });
  }

  /// Null is work that always fails. Copies share it, so that a long chain is as cheap to copy as a short one.
  ContinuationPart::Link part_;
};

/// Runs what is left of a sequence, from `next` on, and puts the values where they are wanted.
template <class T>
Continuation<Unit> restOfSequence(std::shared_ptr<const std::vector<Continuation<T>>> all, std::size_t next,
                                  std::shared_ptr<std::vector<T>> values) {
  if (next == all->size()) return Continuation<Unit>::nothing();
  return (*all)[next].flatMap([all, next, values](T value) {
    if (values) values->push_back(std::move(value));
    return restOfSequence(all, next + 1, values);
  });
}

/// Runs all in order on one thread, up to the first that fails, and yields their values.
template <class T>
Continuation<std::vector<T>> sequence(std::vector<Continuation<T>> continuations) {
  using Values = Continuation<std::vector<T>>;
  const auto all = std::make_shared<const std::vector<Continuation<T>>>(std::move(continuations));
  return Values::failable([all] {
    const auto values = std::make_shared<std::vector<T>>();
    return restOfSequence(all, 0, values).flatMap([values](Unit) {
      return Values([values] { return std::move(*values); });
    });
  });
}

/// The same without the values.
template <class T>
Continuation<Unit> sequence_(std::vector<Continuation<T>> continuations) {
  const auto all = std::make_shared<const std::vector<Continuation<T>>>(std::move(continuations));
  return Continuation<Unit>::failable([all] { return restOfSequence<T>(all, 0, nullptr); });
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
