#pragma once

#include <concepts>
#include <optional>

#include "MarletFoundation/Data/PropertyListValue.h"
#include "MarletFoundation/Platform/FileManager.h"
#include "MarletFoundation/Platform/PropertyListError.h"
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

/// Reading and writing of values of any depth: XML and binary. Failures are `ErrorObject`s of
/// `PropertyListErrorDomain` that say what is wrong and where.
namespace PropertyListSerialization {
MARLET_EXPORT PropertyListValue read(const Data& data);
/// Throws for what the form can't carry: text that is not valid UTF-8, a date that is not finite; in XML also a
/// character that XML has none of, and a date outside the years 0 to 9999. XML keeps of a date its whole second,
/// rounded down.
MARLET_EXPORT Data write(const PropertyListValue& value, PropertyListFormat format);
}  // namespace PropertyListSerialization

/// The value of a platform object, or nothing for an object that no case fits. Tried in order: string,
/// dictionary with string keys only, array, data, date, number by its type code.
MARLET_EXPORT std::optional<PropertyListValue> propertyListValue(const PropertyListObjectPointer& object);
/// The object of a value. Every dictionary in it is an `MLFSortedDictionary`.
MARLET_EXPORT PropertyListObjectPointer propertyListObject(const PropertyListValue& value);

/// The value of an object that must have one: any other is a fatal error.
MARLET_EXPORT PropertyListValue convertiblePropertyListValue(const PropertyListObjectPointer& object);

/// Makes a `T` of an object. One that no case fits is a fatal error. Throws the type's own error.
template <PropertyListSerializable T>
T fromPropertyListObject(const PropertyListObjectPointer& object) {
  return T(convertiblePropertyListValue(object));
}

/// Reads `data` in either form. Throws the reader's error, or the type's own.
template <PropertyListSerializable T>
T fromPropertyListData(const Data& data) {
  return T(PropertyListSerialization::read(data));
}

/// Reads the whole file in either form. Throws the file's error, the reader's, or the type's own.
template <PropertyListSerializable T>
T fromContentsOfPropertyListAtURL(const URL& url) {
  return fromPropertyListData<T>(FileManager::readFile(url));
}

template <PropertyListSerializable T>
PropertyListObjectPointer propertyListObject(const T& serializable) {
  return propertyListObject(PropertyListValue(serializable.propertyListValue()));
}

/// Writes a value to memory. A failing writer is a fatal error: what may hold text from elsewhere is written
/// with `PropertyListSerialization::write`. No options are known; any number is taken.
MARLET_EXPORT Data propertyListData(const PropertyListValue& value, PropertyListFormat format,
                                    int options = 0);
template <PropertyListSerializable T>
Data propertyListData(const T& serializable, PropertyListFormat format, int options = 0) {
  return propertyListData(PropertyListValue(serializable.propertyListValue()), format, options);
}

/// Writes a value to a file, as a whole or not at all. Throws the file's error.
template <PropertyListSerializable T>
void writePropertyList(const T& serializable, const URL& url, PropertyListFormat format, int options = 0) {
  FileManager::writeFileAtomically(url, propertyListData(serializable, format, options));
}

}  // namespace MarletFoundation
