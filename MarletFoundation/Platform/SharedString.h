#pragma once

#include <atomic>
#include <cstddef>
#include <string_view>
#include <utility>

#include "MarletFoundation/Platform/Export.h"

namespace MarletFoundation {

/// An immutable string whose copies share one buffer, for what many hold alike: the keys that a list's records
/// repeat, the names that a tree's directories have in common.
class MARLET_EXPORT SharedString {
 public:
  /// The empty string, which needs no buffer.
  SharedString() noexcept = default;
  explicit SharedString(std::string_view text);
  SharedString(const SharedString& other) noexcept : buffer_(other.buffer_) {
    if (buffer_) buffer_->owners.fetch_add(1, std::memory_order_relaxed);
  }
  SharedString(SharedString&& other) noexcept : buffer_(std::exchange(other.buffer_, nullptr)) {}
  SharedString& operator=(SharedString other) noexcept {
    std::swap(buffer_, other.buffer_);
    return *this;
  }
  ~SharedString() {
    if (buffer_ && buffer_->owners.fetch_sub(1, std::memory_order_acq_rel) == 1) destroy();
  }

  std::string_view view() const { return buffer_ ? buffer_->text() : std::string_view(); }
  operator std::string_view() const { return view(); }
  /// The characters with a NUL behind them.
  const char* c_str() const { return buffer_ ? buffer_->characters() : ""; }
  bool empty() const { return !buffer_; }

 private:
  // The characters follow in the same allocation.
  struct Buffer {
    std::atomic<std::size_t> owners{1};
    std::size_t size;

    explicit Buffer(std::size_t count) : size(count) {}
    const char* characters() const { return reinterpret_cast<const char*>(this + 1); }
    std::string_view text() const { return {characters(), size}; }
  };
  void destroy() noexcept;

  Buffer* buffer_ = nullptr;
};

}  // namespace MarletFoundation
