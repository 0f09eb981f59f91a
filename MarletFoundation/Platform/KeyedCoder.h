#pragma once

#include <optional>
#include <string>

#include "MarletFoundation/Platform/Data.h"
#include "MarletFoundation/Platform/URL.h"

namespace MarletFoundation {

/// Where an object keeps its fields by key when it travels: a host writes one over its own archive.
class MARLET_EXPORT KeyedCoder {
 public:
  virtual ~KeyedCoder() = default;
  virtual void encodeURL(const URL& url, std::string_view key) = 0;
  virtual void encodeData(const Data& data, std::string_view key) = 0;
  /// Nothing where there is none, or something else.
  virtual std::optional<URL> decodeURL(std::string_view key) const = 0;
  virtual std::optional<Data> decodeData(std::string_view key) const = 0;
};

}  // namespace MarletFoundation
