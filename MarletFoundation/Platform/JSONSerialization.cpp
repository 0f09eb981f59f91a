#include "MarletFoundation/Platform/JSONSerialization.h"

#include <nlohmann/json.hpp>

#include "MarletFoundation/Platform/ErrorObject.h"

namespace MarletFoundation::JSONSerialization {
namespace {

using Library = nlohmann::ordered_json;

[[noreturn]] void fail(std::string message) {
  throw ErrorObject::withMessage(ErrorDomain, 0, std::move(message));
}

/// Takes the parser's events. The objects of open containers lie on one stack, from which each container takes
/// its own when it ends.
class Reader final : public nlohmann::json_sax<nlohmann::json> {
 public:
  PropertyListObjectPointer take() { return std::move(objects_.back()); }

  bool null() override { return add(std::make_shared<NullObject>()); }
  bool boolean(bool value) override { return add(NumberObject::boolean(value)); }
  bool number_integer(number_integer_t value) override { return add(NumberObject::integer(value)); }
  bool number_unsigned(number_unsigned_t value) override {
    return add(value <= INT64_MAX ? NumberObject::integer(static_cast<std::int64_t>(value))
                                  : NumberObject::real(static_cast<double>(value)));
  }
  bool number_float(number_float_t value, const string_t&) override { return add(NumberObject::real(value)); }
  bool string(string_t& value) override { return add(std::make_shared<StringObject>(std::move(value))); }
  bool binary(binary_t&) override { return false; }
  bool key(string_t& value) override {
    keys_.push_back(std::make_shared<StringObject>(std::move(value)));
    return true;
  }
  bool start_object(std::size_t) override { return open(); }
  bool start_array(std::size_t) override { return open(); }
  bool end_object() override {
    const auto values = taken(objects_);
    const auto keys = taken(keys_, values.size());
    return add(std::make_shared<PlainDictionary>(values, keys));
  }
  bool end_array() override { return add(std::make_shared<ArrayObject>(taken(objects_))); }
  bool parse_error(std::size_t place, const std::string&, const nlohmann::detail::exception& error) override {
    fail("This is no JSON at byte " + std::to_string(place) + ": " + error.what());
  }

 private:
  bool add(PropertyListObjectPointer object) {
    objects_.push_back(std::move(object));
    return true;
  }
  bool open() {
    if (starts_.size() == DepthLimit) fail("Arrays and dictionaries lie deeper in each other than 512.");
    starts_.push_back(objects_.size());
    return true;
  }
  /// What the innermost open container holds, which closes it.
  PropertyListObjects taken(PropertyListObjects& stack) {
    const auto count = stack.size() - starts_.back();
    starts_.pop_back();
    return taken(stack, count);
  }
  static PropertyListObjects taken(PropertyListObjects& stack, std::size_t count) {
    const auto first = stack.end() - static_cast<std::ptrdiff_t>(count);
    PropertyListObjects objects(std::make_move_iterator(first), std::make_move_iterator(stack.end()));
    stack.erase(first, stack.end());
    return objects;
  }

  PropertyListObjects objects_;
  PropertyListObjects keys_;
  std::vector<std::size_t> starts_;
};

Library treeOf(const PropertyListObject& object, int depth);

Library treeOfNumber(const NumberObject& number) {
  const auto kind = kindOf(number);
  if (kind == NumberKind::boolean) return number.boolValue();
  if (kind == NumberKind::integer) return number.integerValue();
  if (!std::isfinite(number.doubleValue())) fail("JSON has no form for numbers that aren't finite.");
  return number.doubleValue();
}

Library treeOfDictionary(const DictionaryObject& dictionary, int depth) {
  auto tree = Library::object();
  // A dictionary's keys differ. Added by the array beneath, none is searched for among those before it.
  auto& entries = tree.get_ref<Library::object_t&>();
  entries.reserve(dictionary.count());
  for (const auto& key : dictionary.allKeys()) {
    const auto* name = dynamic_cast<const StringObject*>(key.get());
    if (!name) fail("JSON has no form for keys that aren't strings.");
    entries.emplace_back(name->value, treeOf(*dictionary.objectForKey(*key), depth + 1));
  }
  return tree;
}

Library treeOf(const PropertyListObject& object, int depth) {
  if (dynamic_cast<const NullObject*>(&object)) return nullptr;
  if (const auto* string = dynamic_cast<const StringObject*>(&object)) return string->value;
  if (const auto* number = dynamic_cast<const NumberObject*>(&object)) return treeOfNumber(*number);
  if (depth == DepthLimit) fail("Arrays and dictionaries lie deeper in each other than 512.");
  if (const auto* dictionary = dynamic_cast<const DictionaryObject*>(&object))
    return treeOfDictionary(*dictionary, depth);
  const auto* array = dynamic_cast<const ArrayObject*>(&object);
  if (!array) fail("JSON has no form for an object of this kind.");
  auto tree = Library::array();
  for (const auto& element : array->objects()) tree.push_back(treeOf(*element, depth + 1));
  return tree;
}

}  // namespace

NumberKind kindOf(const NumberObject& number) {
  const auto& code = number.typeCode();
  if (code == "c" || code == "C" || code == "B") return NumberKind::boolean;
  return code == "d" || code == "f" ? NumberKind::real : NumberKind::integer;
}

PropertyListObjectPointer read(const Data& data) {
  Reader reader;
  const auto bytes = data.view();
  nlohmann::json::sax_parse(bytes.begin(), bytes.end(), &reader);
  return reader.take();
}

std::string write(const PropertyListObject& object) {
  try {
    return treeOf(object, 0).dump();
  } catch (const nlohmann::json::exception& error) {
    fail(error.what());
  }
}

}  // namespace MarletFoundation::JSONSerialization
