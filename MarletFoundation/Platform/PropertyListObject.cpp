#include "MarletFoundation/Platform/PropertyListObject.h"

#include <algorithm>
#include <cmath>
#include <functional>
#include <limits>

namespace MarletFoundation {
namespace {

// How deep destructors may follow objects on the stack. What lies deeper waits for the outermost one.
constexpr int releaseDepthLimit = 64;
thread_local int releaseDepth = 0;
thread_local ContainedPropertyListObjects* waiting = nullptr;

void release(ContainedPropertyListObjects& objects) noexcept {
  if (releaseDepth == releaseDepthLimit) return waiting->splice(waiting->end(), objects);
  ContainedPropertyListObjects deeper;
  const bool isOutermost = releaseDepth == 0;
  if (isOutermost) waiting = &deeper;
  ++releaseDepth;
  objects.clear();
  while (isOutermost && !deeper.empty()) {
    const auto next = std::move(deeper.front());
    deeper.pop_front();
  }
  --releaseDepth;
}

template <class Object>
const Object* as(const PropertyListObject& object) {
  return dynamic_cast<const Object*>(&object);
}

// Compares containers without following them on the stack.
bool haveEqualContents(const PropertyListObject& a, const PropertyListObject& b) {
  std::vector<std::pair<PropertyListObjectPointer, PropertyListObjectPointer>> open;
  // Whether two objects may be equal, as far as they tell without what they contain, which is compared later.
  const auto mayBeEqual = [&open](const PropertyListObject& one, const PropertyListObject& other) {
    if (const auto* ours = as<ArrayObject>(one)) {
      const auto* theirs = as<ArrayObject>(other);
      if (!theirs || ours->objects().size() != theirs->objects().size()) return false;
      for (std::size_t i = 0; i < ours->objects().size(); ++i)
        open.emplace_back(ours->objects()[i], theirs->objects()[i]);
      return true;
    }
    // A host's own dictionaries compare as they like.
    if (!as<PlainDictionary>(one) && !as<MLFSortedDictionary>(one)) return one.isEqual(other);
    const auto* ours = as<DictionaryObject>(one);
    const auto* theirs = as<DictionaryObject>(other);
    if (!theirs || ours->count() != theirs->count()) return false;
    for (const auto& key : ours->allKeys()) {
      auto value = theirs->objectForKey(*key);
      if (!value) return false;
      open.emplace_back(ours->objectForKey(*key), std::move(value));
    }
    return true;
  };
  if (!mayBeEqual(a, b)) return false;
  while (!open.empty()) {
    const auto [one, other] = std::move(open.back());
    open.pop_back();
    if (!mayBeEqual(*one, *other)) return false;
  }
  return true;
}

int rank(const PropertyListObject& object) {
  if (as<NumberObject>(object)) return 0;
  if (as<DateObject>(object)) return 1;
  return as<StringObject>(object) ? 2 : 3;
}

bool ascending(const PropertyListObjectPointer& a, const PropertyListObjectPointer& b) {
  if (rank(*a) != rank(*b)) return rank(*a) < rank(*b);
  if (const auto* string = as<StringObject>(*a)) return string->value < as<StringObject>(*b)->value;
  if (const auto* date = as<DateObject>(*a)) return date->value < as<DateObject>(*b)->value;
  if (const auto* number = as<NumberObject>(*a)) {
    return number->doubleValue() < as<NumberObject>(*b)->doubleValue();
  }
  return false;
}

}  // namespace

bool StringObject::isEqual(const PropertyListObject& other) const {
  const auto* string = as<StringObject>(other);
  return string && value == string->value;
}
std::size_t StringObject::hash() const { return std::hash<std::string_view>()(value); }

bool DataObject::isEqual(const PropertyListObject& other) const {
  const auto* data = as<DataObject>(other);
  return data && value == data->value;
}
std::size_t DataObject::hash() const { return std::hash<std::string_view>()(value.view()); }

bool DateObject::isEqual(const PropertyListObject& other) const {
  const auto* date = as<DateObject>(other);
  return date && value == date->value;
}
std::size_t DateObject::hash() const { return std::hash<double>()(value.secondsSinceReferenceDate); }

PropertyListObjectPointer NumberObject::boolean(bool value) {
  return std::make_shared<NumberObject>("c", std::int64_t{value});
}
PropertyListObjectPointer NumberObject::integer(std::int64_t value) {
  return std::make_shared<NumberObject>("q", value);
}
PropertyListObjectPointer NumberObject::real(double value) {
  return std::make_shared<NumberObject>("d", value);
}

bool NumberObject::boolValue() const {
  return std::visit([](auto number) { return number != 0; }, value_);
}

std::int64_t NumberObject::integerValue() const {
  const auto* real = std::get_if<double>(&value_);
  if (!real) return std::visit([](auto number) { return static_cast<std::int64_t>(number); }, value_);
  constexpr double limit = 9223372036854775808.0;
  if (std::isnan(*real)) return 0;
  if (*real >= limit) return std::numeric_limits<std::int64_t>::max();
  return *real < -limit ? std::numeric_limits<std::int64_t>::min() : static_cast<std::int64_t>(*real);
}

double NumberObject::doubleValue() const {
  return std::visit([](auto number) { return static_cast<double>(number); }, value_);
}

bool NumberObject::isEqual(const PropertyListObject& other) const {
  const auto* number = as<NumberObject>(other);
  if (!number || doubleValue() != number->doubleValue()) return false;
  // Large integers that share a double still differ, unsigned ones also from negative ones.
  return std::holds_alternative<double>(value_) || std::holds_alternative<double>(number->value_) ||
         integerValue() == number->integerValue();
}
std::size_t NumberObject::hash() const { return std::hash<double>()(doubleValue()); }

ArrayObject::~ArrayObject() { release(objects_); }

bool ArrayObject::isEqual(const PropertyListObject& other) const { return haveEqualContents(*this, other); }
std::size_t ArrayObject::hash() const { return objects().size(); }

bool DictionaryObject::isEqual(const PropertyListObject& other) const {
  const auto* dictionary = as<DictionaryObject>(other);
  return dictionary && isEqualToDictionary(*dictionary);
}
std::size_t DictionaryObject::hash() const { return count(); }

PlainDictionary::PlainDictionary(const PropertyListObjects& objects, const PropertyListObjects& keys) {
  auto& kept = keys_.front();
  auto& values = values_.front();
  kept.reserve(keys.size());
  values.reserve(keys.size());
  places_.reserve(keys.size());
  for (std::size_t i = 0; i < keys.size(); ++i) {
    const auto [place, isNew] = places_.try_emplace(keys[i].get(), kept.size());
    if (isNew) {
      kept.push_back(keys[i]);
      values.push_back(objects[i]);
    } else {
      values[place->second] = objects[i];
    }
  }
}

PlainDictionary::~PlainDictionary() {
  release(keys_);
  release(values_);
}

PropertyListObjectPointer PlainDictionary::objectForKey(const PropertyListObject& key) const {
  const auto found = places_.find(&key);
  return found == places_.end() ? nullptr : values_.front()[found->second];
}

bool PlainDictionary::isEqualToDictionary(const DictionaryObject& other) const {
  return haveEqualContents(*this, other);
}

MLFSortedDictionary::MLFSortedDictionary(const PropertyListObjects& objects, const PropertyListObjects& keys)
    : _underlyingDictionary(objects, keys) {}

namespace {

PropertyListObjects valuesForKeys(const DictionaryObject& dictionary, const PropertyListObjects& keys) {
  PropertyListObjects values;
  values.reserve(keys.size());
  for (const auto& key : keys) values.push_back(dictionary.objectForKey(*key));
  return values;
}

}  // namespace

MLFSortedDictionary::MLFSortedDictionary(const DictionaryObject& dictionary)
    : _underlyingDictionary(valuesForKeys(dictionary, dictionary.allKeys()), dictionary.allKeys()) {}

PropertyListObjects MLFSortedDictionary::allKeys() const {
  auto keys = _underlyingDictionary.allKeys();
  std::stable_sort(keys.begin(), keys.end(), ascending);
  return keys;
}

}  // namespace MarletFoundation
