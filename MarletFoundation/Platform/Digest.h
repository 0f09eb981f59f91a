#pragma once

#include <array>
#include <cstdint>
#include <memory>
#include <string_view>

#include "MarletFoundation/Platform/Export.h"

namespace MarletFoundation {

/// A running MD5 digest, for names and change detection, not for security.
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

}  // namespace MarletFoundation
