#pragma once

#include <atomic>
#include <condition_variable>
#include <deque>
#include <mutex>
#include <string>
#include <thread>
#include <vector>

#include "ArcCopier/EntryReader.h"

namespace ArcCopierImplementation {

/// Decompresses entries on a thread of its own, some way ahead of who writes them: of both kinds of work there
/// is about as much. Holds a few megabytes at most.
class ReadAhead {
 public:
  /// Part of an entry.
  struct Chunk {
    const ZipEntry* entry;
    std::string bytes;
    /// Whether the entry ends here; only then are its size and checksum known to be right.
    bool isLast;
    /// What stands against the entry; it has no more chunks then.
    Problem problem;
  };

  /// `entries` lie in one array, in the order in which they will be asked for.
  ReadAhead(int file, std::vector<const ZipEntry*> entries);
  ~ReadAhead();
  ReadAhead(const ReadAhead&) = delete;
  ReadAhead& operator=(const ReadAhead&) = delete;

  /// The next chunk of an entry. What is left of the ones before it is dropped. Throws `std::bad_alloc` when there
  /// was no memory to read it.
  Chunk next(const ZipEntry* entry);

 private:
  void run();
  void readAll();
  Problem readEntry(const ZipEntry* entry);
  bool isWanted(const ZipEntry* entry) const { return entry >= wanted_.load(std::memory_order_relaxed); }
  void add(Chunk chunk);

  EntryReader reader_;
  const std::vector<const ZipEntry*> entries_;
  std::atomic<const ZipEntry*> wanted_ = nullptr;  // the entry asked for last
  std::deque<Chunk> taken_;                        // the asking thread's own

  std::mutex mutex_;
  std::condition_variable filled_, emptied_;
  std::deque<Chunk> queue_;
  std::size_t queued_ = 0;  // bytes
  bool isAtEnd_ = false;
  bool isOutOfMemory_ = false;
  bool isStopped_ = false;
  std::thread thread_;
};

}  // namespace ArcCopierImplementation
