#include "MarletFoundation/Platform/SharedString.h"

#include <cstring>
#include <new>

namespace MarletFoundation {

SharedString::SharedString(std::string_view text) {
  if (text.empty()) return;
  buffer_ = new (::operator new(sizeof(Buffer) + text.size() + 1)) Buffer(text.size());
  auto* const characters = reinterpret_cast<char*>(buffer_ + 1);
  std::memcpy(characters, text.data(), text.size());
  characters[text.size()] = '\0';
}

void SharedString::destroy() noexcept {
  buffer_->~Buffer();
  ::operator delete(buffer_);
}

}  // namespace MarletFoundation
