#pragma once

#include <concepts>
#include <optional>

#include "MarletFoundation/Data/PropertyListValue.h"
#include "MarletFoundation/Platform/PropertyListObject.h"
#include "MarletFoundation/Platform/URL.h"

namespace MarletFoundation {

/// The forms of a property list, by their numbers.
enum class PropertyListFormat { xml = 100, binary = 200 };

/// A type that is made from a property-list value, throwing its own error for a wrong shape, and gives its
/// value.
template <class T>
concept PropertyListSerializable = std::constructible_from<T, const PropertyListValue&> &&
    requires(const T& t) {
  { t.propertyListValue() } -> std::convertible_to<PropertyListValue>;
};

/// Reading and writing of values: XML and binary. Failures are `ErrorObject`s of `PropertyListErrorDomain`
/// that say what is wrong and where.
namespace PropertyListSerialization {
MARLET_EXPORT PropertyListValue read(const Data& data);
/// Throws for what the form can't carry: containers nested deeper than 512, and in XML a string with a
/// character that XML has none of.
MARLET_EXPORT Data write(const PropertyListValue& value, PropertyListFormat format);
}  // namespace PropertyListSerialization

/// The value of a platform object, or nothing for an object that no case fits.
MARLET_EXPORT std::optional<PropertyListValue> propertyListValue(const PropertyListObjectPointer& object);
MARLET_EXPORT PropertyListObjectPointer propertyListObject(const PropertyListValue& value);

/// Reads `data` in either form. Throws the reader's error, or the type's own.
template <PropertyListSerializable T>
T fromPropertyListData(const Data& data);
template <PropertyListSerializable T>
T fromContentsOfPropertyListAtURL(const URL& url);

}  // namespace MarletFoundation
