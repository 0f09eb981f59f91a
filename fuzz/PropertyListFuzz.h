#pragma once

#include <cstdlib>

#include "MarletFoundation/Data/PropertyListSerializable.h"

namespace MarletFoundation {

inline void require(bool condition) {
  if (!condition) std::abort();
}

/// Reads `text` as a value and as objects, which must agree, and writes the value in the same form twice, from
/// what was read and from what that writing reads as. The same bytes show the same value, NaN included.
inline void checkReading(std::string text, PropertyListFormat form) {
  const Data data(std::move(text));
  PropertyListValue value;
  try {
    value = PropertyListSerialization::read(data);
  } catch (const ErrorObject& error) {
    require(error.domain() == PropertyListErrorDomain && !error.userInfo().empty());
    return;
  }
  const auto written = PropertyListSerialization::write(value, form);
  require(PropertyListSerialization::write(PropertyListSerialization::read(written), form) == written);
  const auto converted = propertyListValue(readPropertyListObject(data));
  require(converted && PropertyListSerialization::write(*converted, form) == written);
}

}  // namespace MarletFoundation
