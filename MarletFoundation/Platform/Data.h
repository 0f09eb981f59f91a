#pragma once

#include <cstddef>
#include <cstdint>
#include <memory>
#include <optional>
#include <span>
#include <string>
#include <string_view>
#include <vector>

#include "MarletFoundation/Platform/Export.h"

namespace MarletFoundation {

class URL;

/// Immutable bytes. Copies and slices share one buffer and keep it alive.
class MARLET_EXPORT Data {
 public:
  Data() = default;
  /// Takes over the text's or the vector's bytes without copying them.
  explicit Data(std::string text);
  explicit Data(std::vector<std::uint8_t> bytes);
  /// Bytes that `owner` keeps alive and unchanged, such as a mapped file.
  Data(std::shared_ptr<const void> owner, std::span<const std::uint8_t> bytes)
      : owner_(std::move(owner)), bytes_(bytes) {}

  std::span<const std::uint8_t> bytes() const { return bytes_; }
  std::string_view view() const { return {reinterpret_cast<const char*>(bytes_.data()), bytes_.size()}; }
  std::size_t size() const { return bytes_.size(); }
  bool empty() const { return bytes_.empty(); }

  /// The `count` bytes from `offset` on, sharing the buffer. Both must lie within the data.
  Data slice(std::size_t offset, std::size_t count) const { return {owner_, bytes_.subspan(offset, count)}; }

  /// The 20-byte SHA-1 digest of the bytes. To tell contents apart, not for security.
  Data mlf_SHA1Digest() const;
  /// The digest of a file's contents, which are mapped (`FileManager::mapFile`), or nothing if it can't be
  /// read.
  static std::optional<Data> mlf_SHA1DigestForURL(const URL& url);

  bool operator==(const Data& other) const { return view() == other.view(); }

 private:
  std::shared_ptr<const void> owner_;
  std::span<const std::uint8_t> bytes_;
};

}  // namespace MarletFoundation
