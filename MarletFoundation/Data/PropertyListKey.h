#pragma once

#include <atomic>
#include <string_view>
#include <utility>

#include "MarletFoundation/Platform/Export.h"

namespace MarletFoundation {

/// A dictionary's key: an immutable string whose copies share one buffer, since the records of a list repeat
/// a few keys.
class MARLET_EXPORT PropertyListKey {
 public:
  explicit PropertyListKey(std::string_view text);
  PropertyListKey(const PropertyListKey& other) noexcept;
  PropertyListKey(PropertyListKey&& other) noexcept : buffer_(std::exchange(other.buffer_, nullptr)) {}
  PropertyListKey& operator=(PropertyListKey other) noexcept;
  ~PropertyListKey() {
    if (buffer_) release();
  }

  std::string_view view() const;
  operator std::string_view() const { return view(); }

 private:
  struct Buffer;
  void release() noexcept;

  Buffer* buffer_;
};

}  // namespace MarletFoundation
