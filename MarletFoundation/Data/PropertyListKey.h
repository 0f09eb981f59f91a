#pragma once

#include <atomic>
#include <cstddef>
#include <string_view>
#include <utility>

#include "MarletFoundation/Platform/Export.h"

namespace MarletFoundation {

/// A dictionary's key: an immutable string whose copies share one buffer, since the records of a list repeat
/// a few keys.
class MARLET_EXPORT PropertyListKey {
 public:
  /// The empty key, which needs no buffer.
  PropertyListKey() noexcept = default;
  explicit PropertyListKey(std::string_view text);
  PropertyListKey(const PropertyListKey& other) noexcept : buffer_(other.buffer_) {
    if (buffer_) buffer_->owners.fetch_add(1, std::memory_order_relaxed);
  }
  PropertyListKey(PropertyListKey&& other) noexcept : buffer_(std::exchange(other.buffer_, nullptr)) {}
  PropertyListKey& operator=(PropertyListKey other) noexcept {
    std::swap(buffer_, other.buffer_);
    return *this;
  }
  ~PropertyListKey() {
    if (buffer_ && buffer_->owners.fetch_sub(1, std::memory_order_acq_rel) == 1) destroy();
  }

  std::string_view view() const { return buffer_ ? buffer_->text() : std::string_view(); }
  operator std::string_view() const { return view(); }

 private:
  // The characters follow in the same allocation.
  struct Buffer {
    std::atomic<std::size_t> owners{1};
    std::size_t size;

    explicit Buffer(std::size_t count) : size(count) {}
    std::string_view text() const { return {reinterpret_cast<const char*>(this + 1), size}; }
  };
  void destroy() noexcept;

  Buffer* buffer_ = nullptr;
};

}  // namespace MarletFoundation
