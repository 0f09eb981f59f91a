#include "MarletFoundation/Data/PropertyListSerializable.h"

#include "MarletFoundation/Data/PropertyListValueBuilder.h"
#include "MarletFoundation/Data/PropertyListWriters.h"
#include "MarletFoundation/Platform/FatalError.h"

namespace MarletFoundation {

PropertyListValue PropertyListSerialization::read(const Data& data) {
  // One for all reads of a thread: the many small lists of a document repeat their keys.
  thread_local PropertyListValueBuilder builder;
  struct Clearing {
    ~Clearing() { builder.clear(); }
  } clearing;
  readPropertyList(data, builder);
  return builder.take();
}

Data PropertyListSerialization::write(const PropertyListValue& value, PropertyListFormat format) {
  return Data(format == PropertyListFormat::xml ? xmlPropertyList(value) : binaryPropertyList(value));
}

Data propertyListData(const PropertyListValue& value, PropertyListFormat format, int) {
  try {
    return PropertyListSerialization::write(value, format);
  } catch (const ErrorObject& error) {
    fatalError("A property-list value could not be written: " + error.localizedDescription());
  }
}

PropertyListValue convertiblePropertyListValue(const PropertyListObjectPointer& object) {
  auto value = propertyListValue(object);
  if (!value) fatalError("An object that is no property-list value was given to be converted.");
  return std::move(*value);
}

}  // namespace MarletFoundation
