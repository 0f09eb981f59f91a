#include <charconv>

#include "MarletFoundation/Data/PropertyListValue.h"
#include "MarletFoundation/Platform/Text.h"

namespace MarletFoundation {
namespace {

template <class Number>
std::string numberText(Number value) {
  char buffer[32];
  return {buffer, std::to_chars(buffer, std::end(buffer), value).ptr};
}

std::string scalarDescription(const PropertyListValue& value) {
  if (const auto* string = value.string()) return "string(" + quoted(*string) + ")";
  if (const auto* data = value.data()) return "data(" + numberText(data->size()) + " bytes)";
  if (const auto* date = value.date()) return "date(" + numberText(date->secondsSinceReferenceDate) + ")";
  if (const auto* integer = value.integer()) return "integer(" + numberText(*integer) + ")";
  if (const auto* real = value.floatingPoint()) return "floatingPoint(" + numberText(*real) + ")";
  return *value.boolean() ? "boolean(true)" : "boolean(false)";
}

// A container of which `next` children are printed.
struct OpenContainer {
  const PropertyListValue* value;
  std::size_t next = 0;
};

}  // namespace

std::string description(const PropertyListValue& value) {
  std::string text;
  std::vector<OpenContainer> open;
  const auto print = [&](const PropertyListValue& child) {
    if (child.payload.index() > 1) {
      text += scalarDescription(child);
      return;
    }
    text += child.array() ? "array([" : child.dictionary()->empty() ? "dictionary([:" : "dictionary([";
    open.push_back({&child});
  };
  print(value);
  while (!open.empty()) {
    auto& container = open.back();
    const auto index = container.next++;
    const auto* array = container.value->array();
    const auto* dictionary = container.value->dictionary();
    if (index == (array ? array->size() : dictionary->size())) {
      text += "])";
      open.pop_back();
      continue;
    }
    if (index > 0) text += ", ";
    if (array) {
      print((*array)[index]);
    } else {
      const auto& entry = dictionary->begin()[static_cast<std::ptrdiff_t>(index)];
      text += quoted(entry.key) + ": ";
      print(entry.value);
    }
  }
  return text;
}

std::string optionalDescription(const PropertyListValue* value) {
  return value ? "Optional(" + description(*value) + ")" : "nil";
}

}  // namespace MarletFoundation
