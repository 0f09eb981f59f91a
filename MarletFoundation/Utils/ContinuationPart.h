#pragma once

#include <memory>

#include "MarletFoundation/Platform/SharedRelease.h"

namespace MarletFoundation {

/// One part of a continuation, which its copies share. It has no type, so that parts can be run one behind the other,
/// and let go in the same way: however many are chained, they take no stack.
class MARLET_EXPORT ContinuationPart {
 public:
  using Link = std::shared_ptr<const ContinuationPart>;
  using Value = std::shared_ptr<void>;
  /// What a part comes to: a value, or a part that goes on in its place; with neither it has failed.
  struct Outcome {
    Value value;
    Link next;
  };

  /// Without a part in front.
  ContinuationPart() = default;
  /// A part that waits for the value of `prior`, which isn't null.
  explicit ContinuationPart(Link prior) : prior_(std::move(prior)) {}
  virtual ~ContinuationPart() { releaseWithoutStack(std::move(prior_)); }
  ContinuationPart(const ContinuationPart&) = delete;
  ContinuationPart& operator=(const ContinuationPart&) = delete;

  /// Runs a part on this thread, to its value or, when it or one on its way fails, to null; no part fails, too.
  static Value run(Link part);

 private:
  /// `value` is what the part in front has yielded; null without one.
  virtual Outcome proceed(void* value) const = 0;

  Link prior_;
};

}  // namespace MarletFoundation
