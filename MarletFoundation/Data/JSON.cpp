#include "MarletFoundation/Data/JSON.h"

#include "MarletFoundation/Platform/JSONSerialization.h"

namespace MarletFoundation {
namespace {

constexpr std::string_view kindNames[] = {"double", "integer",    "boolean", "string",
                                          "array",  "dictionary", "null"};

template <JSON::Kind kind>
const auto& payloadOf(const JSON& json) {
  const auto* payload = std::get_if<static_cast<std::size_t>(kind)>(&json.payload);
  if (!payload) throw JSONError(kind);
  return *payload;
}

JSON convert(const PropertyListObject& object, int depth);

JSON convertNumber(const NumberObject& number) {
  using JSONSerialization::NumberKind;
  const auto kind = JSONSerialization::kindOf(number);
  if (kind == NumberKind::boolean) return JSON(number.boolValue());
  return kind == NumberKind::real ? JSON(number.doubleValue()) : JSON(number.integerValue());
}

JSON::Dictionary convertDictionary(const DictionaryObject& dictionary, int depth) {
  JSON::Dictionary values;
  for (const auto& key : dictionary.allKeys()) {
    const auto* name = dynamic_cast<const StringObject*>(key.get());
    if (!name) throw JSONError(JSONErrorCase::InvalidType);
    values.insert_or_assign(name->value, convert(*dictionary.objectForKey(*key), depth + 1));
  }
  return values;
}

JSON convert(const PropertyListObject& object, int depth) {
  if (const auto* number = dynamic_cast<const NumberObject*>(&object)) return convertNumber(*number);
  if (const auto* string = dynamic_cast<const StringObject*>(&object)) return JSON(string->value);
  if (dynamic_cast<const NullObject*>(&object)) return JSON();
  if (depth == JSONSerialization::DepthLimit) throw JSONError(JSONErrorCase::InvalidType);
  if (const auto* dictionary = dynamic_cast<const DictionaryObject*>(&object))
    return JSON(convertDictionary(*dictionary, depth));
  const auto* array = dynamic_cast<const ArrayObject*>(&object);
  if (!array) throw JSONError(JSONErrorCase::InvalidType);
  JSON::Array elements;
  for (const auto& element : array->objects()) elements.push_back(convert(*element, depth + 1));
  return JSON(std::move(elements));
}

}  // namespace

const ErrorTable& errorTable(JSONErrorCase) {
  static constexpr ErrorRow rows[] = {{"DecodingTypeMismatch"}, {"InvalidType"}, {"UnexpectedOptional"}};
  static constexpr ErrorTable table{"MarletFoundation.JSONError", rows};
  return table;
}

std::string JSONError::description() const {
  const std::string name(caseName());
  return expectedKind ? name + "(" + std::string(MarletFoundation::description(*expectedKind)) + ")" : name;
}

JSON::JSON(const Data& data) : JSON(*JSONSerialization::read(data)) {}
JSON::JSON(const PropertyListObject& object) : JSON(convert(object, 0)) {}

std::string_view description(JSON::Kind kind) { return kindNames[static_cast<std::size_t>(kind)]; }

std::string JSONInitializer<std::string>::init(const JSON& json) {
  return payloadOf<JSON::Kind::string>(json);
}
bool JSONInitializer<bool>::init(const JSON& json) { return payloadOf<JSON::Kind::boolean>(json); }
double JSONInitializer<double>::init(const JSON& json) { return payloadOf<JSON::Kind::double_>(json); }
std::int64_t JSONInitializer<std::int64_t>::init(const JSON& json) {
  return payloadOf<JSON::Kind::integer>(json);
}

const JSON::Array& arrayOf(const JSON& json) { return payloadOf<JSON::Kind::array>(json); }
const JSON::Dictionary& dictionaryOf(const JSON& json) { return payloadOf<JSON::Kind::dictionary>(json); }

}  // namespace MarletFoundation
