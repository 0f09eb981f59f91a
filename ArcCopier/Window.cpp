#include "ArcCopier/Window.h"

#include <unistd.h>

#include <cerrno>

namespace ArcCopierImplementation {

int Window::read(std::uint64_t offset, std::size_t least, std::string_view& bytes) {
  const bool isAtHand =
      offset >= offset_ && offset - offset_ < filled_ && least <= filled_ - (offset - offset_);
  if (!isAtHand) {
    if (const int error = fill(offset, least)) return error;
  }
  bytes = std::string_view(buffer_.get(), filled_).substr(static_cast<std::size_t>(offset - offset_));
  return 0;
}

int Window::fill(std::uint64_t offset, std::size_t least) {
  if (least > size_) {
    buffer_.reset(new char[least]);
    size_ = least;
  }
  offset_ = offset;
  filled_ = 0;
  while (filled_ < least) {
    const auto count =
        ::pread(file_, buffer_.get() + filled_, size_ - filled_, static_cast<off_t>(offset + filled_));
    if (count < 0 && errno == EINTR) continue;
    if (count < 0) return errno;
    if (count == 0) break;
    filled_ += static_cast<std::size_t>(count);
  }
  return 0;
}

}  // namespace ArcCopierImplementation
