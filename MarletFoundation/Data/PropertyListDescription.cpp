#include <charconv>

#include "MarletFoundation/Data/PropertyListChildren.h"
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

struct OpenContainer {
  PropertyListChildren children;
  bool isFirst = true;
};

}  // namespace

std::string description(const PropertyListValue& value) {
  std::string text;
  std::vector<OpenContainer> open;
  const auto print = [&](const PropertyListValue& child) {
    if (!isPropertyListContainer(child)) {
      text += scalarDescription(child);
      return;
    }
    text += child.array() ? "array([" : child.dictionary()->empty() ? "dictionary([:" : "dictionary([";
    open.push_back({PropertyListChildren(child)});
  };
  print(value);
  while (!open.empty()) {
    auto& [children, isFirst] = open.back();
    if (children.atEnd()) {
      text += "])";
      open.pop_back();
      continue;
    }
    if (!std::exchange(isFirst, false)) text += ", ";
    if (children.isDictionary()) text += quoted(children.key()) + ": ";
    print(children.next());
  }
  return text;
}

std::string optionalDescription(const PropertyListValue* value) {
  return value ? "Optional(" + description(*value) + ")" : "nil";
}

}  // namespace MarletFoundation
