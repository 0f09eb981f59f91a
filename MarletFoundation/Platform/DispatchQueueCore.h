#pragma once

#include <map>
#include <mutex>
#include <utility>

#include "MarletFoundation/Platform/DispatchQueue.h"

namespace MarletFoundation {

/// What the handles to one queue share. Each kind of queue answers the two submissions in its own way.
class DispatchQueueCore {
 public:
  using BlockReference = DispatchQueue::BlockReference;

  /// `global` is the queue that the work of this one goes to, or null.
  DispatchQueueCore(std::string name, DispatchQueueCore* global) : label(std::move(name)), target(global) {}
  DispatchQueueCore(const DispatchQueueCore&) = delete;
  DispatchQueueCore& operator=(const DispatchQueueCore&) = delete;
  virtual ~DispatchQueueCore() = default;

  virtual void sync(BlockReference block, bool barrier) = 0;
  virtual void async(std::function<void()> block, bool barrier) = 0;

  void setValue(const void* key, std::any value);
  std::any value(const void* key) const;

  /// The queue of the block that this thread runs, or null.
  static DispatchQueueCore* current() { return current_; }

  const std::string label;
  DispatchQueueCore* const target;

 protected:
  /// Makes a queue the current one for as long as its block runs.
  class Entered {
   public:
    explicit Entered(DispatchQueueCore& queue) : previous_(std::exchange(current_, &queue)) {}
    ~Entered() { current_ = previous_; }
    Entered(const Entered&) = delete;
    Entered& operator=(const Entered&) = delete;

   private:
    DispatchQueueCore* previous_;
  };

  /// Runs an asynchronous block, whose failure nobody could answer, and releases what it holds.
  static void runToEnd(std::function<void()>& block);

 private:
  // A part of every synchronous submission: this model saves two calls of the dynamic linker.
  [[gnu::tls_model("initial-exec")]] static constinit thread_local DispatchQueueCore* current_;

  mutable std::mutex valuesMutex_;
  std::map<const void*, std::any> values_;
};

}  // namespace MarletFoundation
