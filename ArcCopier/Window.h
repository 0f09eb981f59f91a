#pragma once

#include <cstdint>
#include <memory>
#include <string_view>

namespace ArcCopierImplementation {

/// Reads a file here and there; what lies close together is read in one call.
class Window {
 public:
  /// `size` bytes are read at a time. One that is asked for more keeps that size from then on.
  Window(int file, std::size_t size) : file_(file), size_(size), buffer_(new char[size]) {}

  /// The bytes from an offset on: `least`, which may be more than the window's size, or more as they are at
  /// hand, and fewer only at the end of the file. They stay until the next call. 0 or an errno.
  int read(std::uint64_t offset, std::size_t least, std::string_view& bytes);

 private:
  int fill(std::uint64_t offset, std::size_t least);

  int file_;
  std::size_t size_;
  std::unique_ptr<char[]> buffer_;
  std::uint64_t offset_ = 0;
  std::size_t filled_ = 0;
};

}  // namespace ArcCopierImplementation
