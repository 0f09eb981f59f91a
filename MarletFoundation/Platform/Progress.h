#pragma once

#include <cstdint>
#include <functional>
#include <memory>
#include <mutex>
#include <vector>

#include "MarletFoundation/Platform/Export.h"

namespace MarletFoundation {

/// How far a piece of work has come: completed units of a total, and children that fill units of their own
/// as they advance. Every operation may be called from any thread, so that one thread works and others look
/// on or cancel.
///
/// Work reports into the tree of whoever asked for it without being handed anything: the caller makes its
/// progress current on its thread, for a number of its units, and the work makes its own with `make`.
class MARLET_EXPORT Progress {
 public:
  /// A new progress, child of the thread's current one, if that has units left to give away (the first child
  /// gets all that were made current), else a root.
  static std::shared_ptr<Progress> make(std::int64_t totalUnitCount);
  ~Progress();
  Progress(const Progress&) = delete;
  Progress& operator=(const Progress&) = delete;

  std::int64_t totalUnitCount() const;
  std::int64_t completedUnitCount() const;
  /// More than the total is kept as the total.
  void setCompletedUnitCount(std::int64_t count);
  /// From 0 to 1, the children's parts included. A total of 0 or less counts as nothing done.
  double fractionCompleted() const;
  bool isFinished() const;

  /// Asks the work, and all that it asked for in turn, to stop. Work looks at `isCancelled` or is told by its
  /// handler; it is up to it when to stop.
  void cancel();
  bool isCancelled() const;
  /// Called once, on the cancelling thread; at once when it is cancelled already.
  void setCancellationHandler(std::function<void()> handler);
  /// Called after each change of the fraction, of a child's too, on the thread that made the change. Called
  /// by several threads at a time when several work.
  void setObserver(std::function<void(double fractionCompleted)> observer);

  /// Makes this the current progress of the thread, with so many units for the next child made there. Scopes
  /// nest; units that no child took are completed at the end.
  class MARLET_EXPORT CurrentScope {
   public:
    CurrentScope(std::shared_ptr<Progress> progress, std::int64_t pendingUnitCount);
    ~CurrentScope();
    CurrentScope(const CurrentScope&) = delete;
    CurrentScope& operator=(const CurrentScope&) = delete;

   private:
    friend class Progress;
    std::shared_ptr<Progress> progress_;
    std::int64_t pendingUnitCount_;
    CurrentScope* outer_;
  };
  /// The current progress of the thread, or null.
  static std::shared_ptr<Progress> current();

 private:
  Progress(std::int64_t totalUnitCount, std::shared_ptr<Progress> parent, std::int64_t unitsOfParent);
  double fraction() const;
  void addCompleted(std::int64_t units);
  void leaveParent();
  void collectCancellationHandlers(std::vector<std::function<void()>>& handlers);
  void tellObservers() const;

  const std::shared_ptr<std::mutex> tree_;  // one for all nodes; guards what can change below
  const std::shared_ptr<Progress> parent_;
  const std::int64_t unitsOfParent_;
  const std::int64_t totalUnitCount_;
  std::int64_t completedUnitCount_ = 0;
  std::vector<Progress*> children_;  // the unfinished ones, which take themselves out
  bool countsInParent_;
  bool isCancelled_ = false;
  std::function<void()> cancellationHandler_;
  std::function<void(double)> observer_;
};

}  // namespace MarletFoundation
