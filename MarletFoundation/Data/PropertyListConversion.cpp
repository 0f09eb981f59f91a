#include "MarletFoundation/Data/PropertyListChildren.h"
#include "MarletFoundation/Data/PropertyListSerializable.h"
#include "MarletFoundation/Data/PropertyListValueBuilder.h"
#include "MarletFoundation/Platform/PropertyListObjectBuilder.h"

namespace MarletFoundation {
namespace {

void sendScalar(const PropertyListValue& value, PropertyListEvents& events) {
  if (const auto* string = value.string()) return events.string(*string);
  if (const auto* data = value.data()) return events.data(*data);
  if (const auto* date = value.date()) return events.date(*date);
  if (const auto* integer = value.integer()) return events.integer(*integer);
  if (const auto* real = value.floatingPoint()) return events.real(*real);
  events.boolean(*value.boolean());
}

void sendValue(const PropertyListValue& root, PropertyListEvents& events) {
  std::vector<PropertyListChildren> open;
  const auto send = [&](const PropertyListValue& value) {
    if (!isPropertyListContainer(value)) return sendScalar(value, events);
    if (value.array()) {
      events.beginArray();
    } else {
      events.beginDictionary();
    }
    open.emplace_back(value);
  };
  send(root);
  while (!open.empty()) {
    auto& children = open.back();
    if (children.atEnd()) {
      events.end();
      open.pop_back();
      continue;
    }
    if (children.isDictionary()) events.key(children.key());
    send(children.next());
  }
}

// An object's container of which `next` children were sent; an array has no keys.
struct OpenObject {
  PropertyListObjects keys;
  PropertyListObjects values;
  std::size_t next = 0;
};

bool sendNumber(const NumberObject& number, PropertyListEvents& events) {
  const auto& code = number.typeCode();
  const auto isOneOf = [&code](std::string_view codes) {
    return code.size() == 1 && codes.find(code[0]) != std::string_view::npos;
  };
  if (isOneOf("cCB")) {
    events.boolean(number.boolValue());
  } else if (isOneOf("islqISLQ")) {
    events.integer(number.integerValue());
  } else if (isOneOf("fd")) {
    events.real(number.doubleValue());
  } else {
    return false;
  }
  return true;
}

// Sends an object that has a case, tried in the fixed order of the kinds; false for any other. Of a container
// only the beginning is sent, and what is to follow is put on `open`.
bool sendObject(const PropertyListObject* object, PropertyListEvents& events, std::vector<OpenObject>& open) {
  if (const auto* string = dynamic_cast<const StringObject*>(object)) {
    events.string(string->value);
  } else if (const auto* dictionary = dynamic_cast<const DictionaryObject*>(object)) {
    OpenObject container{dictionary->allKeys(), {}};
    for (const auto& key : container.keys) {
      if (!dynamic_cast<const StringObject*>(key.get())) return false;
      container.values.push_back(dictionary->objectForKey(*key));
    }
    events.beginDictionary();
    open.push_back(std::move(container));
  } else if (const auto* array = dynamic_cast<const ArrayObject*>(object)) {
    events.beginArray();
    open.push_back({{}, array->objects()});
  } else if (const auto* data = dynamic_cast<const DataObject*>(object)) {
    events.data(data->value);
  } else if (const auto* date = dynamic_cast<const DateObject*>(object)) {
    events.date(date->value);
  } else if (const auto* number = dynamic_cast<const NumberObject*>(object)) {
    return sendNumber(*number, events);
  } else {
    return false;
  }
  return true;
}

}  // namespace

std::optional<PropertyListValue> propertyListValue(const PropertyListObjectPointer& object) {
  PropertyListValueBuilder builder;
  std::vector<OpenObject> open;
  if (!sendObject(object.get(), builder, open)) return std::nullopt;
  while (!open.empty()) {
    auto& container = open.back();
    const auto index = container.next++;
    if (index == container.values.size()) {
      builder.end();
      open.pop_back();
      continue;
    }
    if (!container.keys.empty()) builder.key(static_cast<const StringObject&>(*container.keys[index]).value);
    const auto child = container.values[index];
    if (!sendObject(child.get(), builder, open)) return std::nullopt;
  }
  return builder.take();
}

PropertyListObjectPointer propertyListObject(const PropertyListValue& value) {
  PropertyListObjectBuilder builder(PropertyListObjectBuilder::Dictionaries::sorted);
  sendValue(value, builder);
  return builder.take();
}

}  // namespace MarletFoundation
