#include "MarletFoundation/Data/PropertyListKey.h"

#include <cstring>
#include <new>
#include <utility>

namespace MarletFoundation {

// The characters follow the header in the same allocation.
struct PropertyListKey::Buffer {
  std::atomic<std::size_t> owners{1};
  std::size_t size;

  explicit Buffer(std::size_t count) : size(count) {}
  char* text() { return reinterpret_cast<char*>(this + 1); }
};

// The empty key, and one that was moved away, have no buffer.
PropertyListKey::PropertyListKey(std::string_view text) : buffer_(nullptr) {
  if (text.empty()) return;
  buffer_ = new (::operator new(sizeof(Buffer) + text.size())) Buffer(text.size());
  std::memcpy(buffer_->text(), text.data(), text.size());
}

PropertyListKey::PropertyListKey(const PropertyListKey& other) noexcept : buffer_(other.buffer_) {
  if (buffer_) buffer_->owners.fetch_add(1, std::memory_order_relaxed);
}

PropertyListKey& PropertyListKey::operator=(PropertyListKey other) noexcept {
  std::swap(buffer_, other.buffer_);
  return *this;
}

void PropertyListKey::release() noexcept {
  if (buffer_->owners.fetch_sub(1, std::memory_order_acq_rel) == 1) {
    buffer_->~Buffer();
    ::operator delete(buffer_);
  }
}

std::string_view PropertyListKey::view() const {
  return buffer_ ? std::string_view(buffer_->text(), buffer_->size) : std::string_view();
}

}  // namespace MarletFoundation
