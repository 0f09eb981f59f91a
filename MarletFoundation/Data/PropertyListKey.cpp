#include "MarletFoundation/Data/PropertyListKey.h"

#include <cstring>
#include <new>

namespace MarletFoundation {

PropertyListKey::PropertyListKey(std::string_view text) {
  if (text.empty()) return;
  buffer_ = new (::operator new(sizeof(Buffer) + text.size())) Buffer(text.size());
  std::memcpy(reinterpret_cast<char*>(buffer_ + 1), text.data(), text.size());
}

void PropertyListKey::destroy() noexcept {
  buffer_->~Buffer();
  ::operator delete(buffer_);
}

}  // namespace MarletFoundation
