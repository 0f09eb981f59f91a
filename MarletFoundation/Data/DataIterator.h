#pragma once

#include <cstdint>
#include <optional>
#include <utility>

#include "MarletFoundation/Platform/Data.h"
#include "MarletFoundation/Platform/FatalError.h"

namespace MarletFoundation {

/// Walks over bytes from the front. `peek` looks at what comes next, `pop` takes it.
struct DataIterator {
  Data data;
  /// Offset of the next byte.
  std::int64_t currentIndex = 0;

  explicit DataIterator(Data bytes) : data(std::move(bytes)) {}

  /// The next byte; nothing at the end.
  std::optional<std::uint8_t> peek() const {
    if (bytesLeft() <= 0) return std::nullopt;
    return data.bytes()[static_cast<std::size_t>(currentIndex)];
  }
  std::optional<std::uint8_t> pop() {
    const auto byte = peek();
    if (byte) ++currentIndex;
    return byte;
  }
  std::optional<std::uint8_t> next() { return pop(); }

  /// The next bytes, sharing the buffer; nothing when fewer are left, and at the end even for none. A
  /// negative number is fatal.
  std::optional<Data> peek(std::int64_t numberOfBytes) const {
    if (numberOfBytes < 0) fatalError("negative number of bytes");
    const auto left = bytesLeft();
    if (left <= 0 || numberOfBytes > left) return std::nullopt;
    return data.slice(static_cast<std::size_t>(currentIndex), static_cast<std::size_t>(numberOfBytes));
  }
  std::optional<Data> pop(std::int64_t numberOfBytes) {
    auto bytes = peek(numberOfBytes);
    if (bytes) currentIndex += numberOfBytes;
    return bytes;
  }

 private:
  std::int64_t bytesLeft() const {
    if (currentIndex < 0) fatalError("index out of bounds");
    return static_cast<std::int64_t>(data.size()) - currentIndex;
  }
};

}  // namespace MarletFoundation
