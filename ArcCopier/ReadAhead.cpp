#include "ArcCopier/ReadAhead.h"

#include <new>
#include <utility>

namespace ArcCopierImplementation {
namespace {

/// So much is read ahead.
constexpr std::size_t MostBytes = 1 << 20;
constexpr std::size_t MostChunks = 1024;
/// So much is handed over at a time: waking the other thread costs more than a small file.
constexpr std::size_t BatchBytes = 64 << 10;
constexpr std::size_t BatchChunks = 32;

}  // namespace

ReadAhead::ReadAhead(int file, std::vector<const ZipEntry*> entries)
    : reader_(file), entries_(std::move(entries)), thread_([this] { run(); }) {}

ReadAhead::~ReadAhead() {
  {
    const std::lock_guard lock(mutex_);
    isStopped_ = true;
    if (!entries_.empty()) wanted_ = entries_.back() + 1;
  }
  emptied_.notify_one();
  thread_.join();
}

ReadAhead::Chunk ReadAhead::next(const ZipEntry* entry) {
  wanted_.store(entry, std::memory_order_relaxed);
  while (true) {
    while (taken_.empty()) {
      std::unique_lock lock(mutex_);
      filled_.wait(lock, [&] { return isAtEnd_ || queued_ >= BatchBytes || queue_.size() >= BatchChunks; });
      if (isOutOfMemory_ && queue_.empty()) throw std::bad_alloc();
      taken_.swap(queue_);
      queued_ = 0;
      emptied_.notify_one();
    }
    auto chunk = std::move(taken_.front());
    taken_.pop_front();
    if (chunk.entry == entry) return chunk;
  }
}

void ReadAhead::run() {
  bool isOutOfMemory = false;
  try {
    readAll();
  } catch (const std::bad_alloc&) {
    isOutOfMemory = true;
  }
  const std::lock_guard lock(mutex_);
  isAtEnd_ = true;
  isOutOfMemory_ = isOutOfMemory;
  filled_.notify_one();
}

void ReadAhead::readAll() {
  for (const auto* entry : entries_) {
    if (const auto problem = readEntry(entry)) add({entry, {}, true, problem});
    const std::lock_guard lock(mutex_);
    if (isStopped_) return;
  }
}

Problem ReadAhead::readEntry(const ZipEntry* entry) {
  if (const auto problem = reader_.open(*entry)) return problem;
  // A chunk waits until it is known whether another one follows.
  Chunk waiting{entry, {}, false, {}};
  while (isWanted(entry)) {
    std::string_view block;
    if (const auto problem = reader_.read(block)) return problem;
    waiting.isLast = block.empty();
    if (waiting.isLast || !waiting.bytes.empty()) add(std::exchange(waiting, {entry, {}, false, {}}));
    if (block.empty()) break;
    waiting.bytes = block;
  }
  return {};
}

void ReadAhead::add(Chunk chunk) {
  std::unique_lock lock(mutex_);
  emptied_.wait(lock, [&] { return isStopped_ || (queued_ < MostBytes && queue_.size() < MostChunks); });
  queued_ += chunk.bytes.size();
  queue_.push_back(std::move(chunk));
  if (queued_ >= BatchBytes || queue_.size() >= BatchChunks) filled_.notify_one();
}

}  // namespace ArcCopierImplementation
