#pragma once

#include <algorithm>
#include <array>
#include <cstdint>
#include <memory>
#include <span>
#include <string>
#include <string_view>

#include "MarletFoundation/Platform/Export.h"

/// Digests for names and change detection, not for security.
namespace MarletFoundation {

/// A running MD5 digest.
class MARLET_EXPORT MD5 {
 public:
  MD5();
  ~MD5();
  void update(std::string_view bytes);
  /// Ends the digest; it can't be updated afterwards.
  std::array<std::uint8_t, 16> final();

 private:
  struct Context;
  std::unique_ptr<Context> context_;
};

/// A running SHA-1 digest.
class MARLET_EXPORT SHA1 {
 public:
  SHA1();
  ~SHA1();
  void update(std::string_view bytes);
  /// Ends the digest; it can't be updated afterwards.
  std::array<std::uint8_t, 20> final();

 private:
  struct Context;
  std::unique_ptr<Context> context_;
};

/// Feeds a running digest so many bytes at a time.
template <class Digest>
void updateInSlices(Digest& digest, std::string_view bytes, std::size_t sliceSize) {
  for (; !bytes.empty(); bytes.remove_prefix(std::min(sliceSize, bytes.size()))) {
    digest.update(bytes.substr(0, sliceSize));
  }
}

/// Two lower-case digits a byte.
MARLET_EXPORT std::string hexadecimal(std::span<const std::uint8_t> bytes);

}  // namespace MarletFoundation
