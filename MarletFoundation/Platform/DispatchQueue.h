#pragma once

#include <any>
#include <concepts>
#include <functional>
#include <memory>
#include <optional>
#include <string>
#include <type_traits>

#include "MarletFoundation/Platform/Export.h"

namespace MarletFoundation {

class DispatchQueueCore;

/// A name for one kind of value that queues carry. The key's address is its identity, so keys are made
/// static.
template <class Value>
class DispatchSpecificKey {
 public:
  DispatchSpecificKey() = default;
  DispatchSpecificKey(const DispatchSpecificKey&) = delete;
  DispatchSpecificKey& operator=(const DispatchSpecificKey&) = delete;
};

/// How soon the work of a global queue is wanted, most urgent first.
enum class DispatchQuality { userInteractive, userInitiated, defaultQuality, utility, background };

/// A queue of work. Copies are handles to the same queue, which lives as long as a handle or its work does.
/// Every operation may be called from any thread.
///
/// - A serial queue runs one block at a time, in the order of submission.
/// - A concurrent queue starts plain blocks in that order and lets them overlap. A barrier block waits for
///   all blocks before it, runs alone, and holds back all blocks after it, synchronous ones too.
/// - A global queue starts blocks in order, as threads are free. It is shared, so barriers are plain blocks.
/// - The main queue is serial, and its blocks run on the thread that pumps it (`runUntil`).
///
/// Synchronous blocks of all but the main queue run on the caller's thread; when the queue is free, they cost
/// no switch of threads and no allocation. Asynchronous ones run on threads of a small shared pool that grows
/// as it is needed and ends with the process: blocks that wait at that time are never run.
///
/// A block that submits synchronously to the queue that it runs on waits for itself for ever.
class MARLET_EXPORT DispatchQueue {
 public:
  enum class Kind { serial, concurrent };

  /// A new queue whose asynchronous work runs with `target`'s quality.
  explicit DispatchQueue(std::string label, Kind kind = Kind::serial,
                         DispatchQuality target = DispatchQuality::defaultQuality);
  static DispatchQueue main();
  static DispatchQueue global(DispatchQuality quality = DispatchQuality::defaultQuality);

  const std::string& label() const;

  /// Runs `block` and gives back what it returns or throws.
  template <std::invocable Block>
  std::invoke_result_t<Block&> sync(Block&& block) const {
    return submitForResult(block, false);
  }
  template <std::invocable Block>
  std::invoke_result_t<Block&> syncBarrier(Block&& block) const {
    return submitForResult(block, true);
  }

  /// Queues `block` and returns at once. The process stops for an exception that leaves the block.
  void async(std::function<void()> block) const;
  void asyncBarrier(std::function<void()> block) const;
  /// Queues `block` when `seconds` have passed; at once when they aren't positive.
  void asyncAfter(double seconds, std::function<void()> block) const;

  /// Sets this queue's value under `key`, or removes it.
  template <class Value>
  void setSpecific(const DispatchSpecificKey<Value>& key,
                   std::type_identity_t<std::optional<Value>> value) const {
    setValue(&key, value ? std::any(*std::move(value)) : std::any());
  }
  /// This queue's own value under `key`.
  template <class Value>
  std::optional<Value> getSpecific(const DispatchSpecificKey<Value>& key) const {
    return cast<Value>(value(&key));
  }
  /// The value for the block that is running: that of its queue, else that of the global queue which its
  /// queue targets. Nothing outside of blocks; the queues of enclosing blocks don't count.
  template <class Value>
  static std::optional<Value> currentSpecific(const DispatchSpecificKey<Value>& key) {
    return cast<Value>(currentValue(&key));
  }

  /// Whether both are handles to one queue.
  bool operator==(const DispatchQueue&) const = default;

 private:
  /// A borrowed callable: synchronous work needs no copy of its block.
  struct BlockReference {
    const void* block;
    void (*call)(const void*);
    void operator()() const { call(block); }
  };
  friend class DispatchQueueCore;

  explicit DispatchQueue(std::shared_ptr<DispatchQueueCore> core) : core_(std::move(core)) {}

  template <class Block>
  void submit(const Block& block, bool barrier) const {
    submitReference({&block, [](const void* pointer) { (*static_cast<const Block*>(pointer))(); }}, barrier);
  }

  template <class Block>
  std::invoke_result_t<Block&> submitForResult(Block& block, bool barrier) const {
    using Result = std::invoke_result_t<Block&>;
    if constexpr (std::is_void_v<Result>) {
      const auto call = [&] { block(); };
      submit(call, barrier);
    } else if constexpr (std::is_reference_v<Result>) {
      std::remove_reference_t<Result>* result = nullptr;
      const auto keep = [&] {
        Result&& reference = block();
        result = std::addressof(reference);
      };
      submit(keep, barrier);
      return static_cast<Result>(*result);
    } else {
      std::optional<Result> result;
      const auto keep = [&] { result.emplace(block()); };
      submit(keep, barrier);
      return *std::move(result);
    }
  }

  template <class Value>
  static std::optional<Value> cast(const std::any& value) {
    const auto* found = std::any_cast<Value>(&value);
    return found ? std::optional<Value>(*found) : std::nullopt;
  }

  void submitReference(BlockReference block, bool barrier) const;
  void setValue(const void* key, std::any value) const;
  std::any value(const void* key) const;
  static std::any currentValue(const void* key);

  std::shared_ptr<DispatchQueueCore> core_;
};

/// Runs the blocks of the main queue, each on this thread, until `predicate` holds or `timeout` seconds have
/// passed, and returns whether it held. The predicate is tested first, after every block, and a hundred times
/// a second while there is none, so it may look at what other threads do. Called on the main thread only, by
/// a host without an event loop of its own, or from inside one; a block of the main queue may call it too,
/// and then runs the blocks behind itself.
MARLET_EXPORT bool runUntil(const std::function<bool()>& predicate, double timeout);

}  // namespace MarletFoundation
