#pragma once

#include <concepts>
#include <cstdint>
#include <initializer_list>
#include <string>
#include <string_view>
#include <utility>
#include <variant>
#include <vector>

#include "MarletFoundation/Platform/Data.h"
#include "MarletFoundation/Platform/Date.h"
#include "MarletFoundation/Platform/SharedString.h"

namespace MarletFoundation {

struct PropertyListValue;

/// A dictionary from string to value, kept as one array in ascending key order (by code point), so that
/// lookup is logarithmic, iteration sorted, and a large one costs one allocation.
class MARLET_EXPORT PropertyListDictionary {
 public:
  struct Entry;
  using Entries = std::vector<Entry>;

  PropertyListDictionary() noexcept;
  PropertyListDictionary(const PropertyListDictionary& other);
  PropertyListDictionary(PropertyListDictionary&& other) noexcept;
  PropertyListDictionary& operator=(const PropertyListDictionary& other);
  PropertyListDictionary& operator=(PropertyListDictionary&& other) noexcept;
  ~PropertyListDictionary();
  /// Of equal keys the last wins.
  PropertyListDictionary(std::initializer_list<std::pair<std::string_view, PropertyListValue>> entries);
  /// Takes entries in any order; of equal keys the last wins.
  explicit PropertyListDictionary(Entries entries);

  std::size_t size() const;
  bool empty() const;
  /// The value under `key`, or null. The pointer holds until the dictionary changes.
  const PropertyListValue* find(std::string_view key) const;
  PropertyListValue* find(std::string_view key);
  bool contains(std::string_view key) const { return find(key) != nullptr; }
  /// The value under `key`, made when there is none.
  PropertyListValue& operator[](std::string_view key);
  /// True when there was one.
  bool erase(std::string_view key);

  Entries::const_iterator begin() const;
  Entries::const_iterator end() const;
  bool operator==(const PropertyListDictionary& other) const;

 private:
  friend struct PropertyListValue;
  void sortEntries();

  Entries entries_;
};

/// One value of a property list. Copies are independent. Two are equal when they are the same case with equal
/// payloads: an integer never equals a floating point or a boolean. Copying, comparing and destroying need no
/// stack, however deep the value is.
struct MARLET_EXPORT PropertyListValue {
  /// Compilers differ on what `Array{array}` means: an array of one array is made as `Array(1, array)`.
  using Array = std::vector<PropertyListValue>;
  using Dictionary = PropertyListDictionary;
  /// The cases: array, dictionary, string, data, date, integer, floatingPoint, boolean.
  using Payload = std::variant<Array, Dictionary, std::string, Data, Date, std::int64_t, double, bool>;

  Payload payload;

  PropertyListValue() = default;
  PropertyListValue(Array value);
  PropertyListValue(Dictionary value);
  PropertyListValue(std::string value) : payload(std::move(value)) {}
  PropertyListValue(std::string_view value) : payload(std::string(value)) {}
  PropertyListValue(const char* value) : payload(std::string(value)) {}
  PropertyListValue(Data value) : payload(std::move(value)) {}
  PropertyListValue(Date value) : payload(value) {}
  template <std::integral Integer>
  requires(!std::same_as<Integer, bool>) PropertyListValue(Integer value)
      : payload(static_cast<std::int64_t>(value)) {}
  PropertyListValue(double value) : payload(value) {}
  PropertyListValue(bool value) : payload(value) {}
  /// The named case, made in place.
  template <class Case, class... Arguments>
  explicit PropertyListValue(std::in_place_type_t<Case> named, Arguments&&... arguments)
      : payload(named, std::forward<Arguments>(arguments)...) {}

  PropertyListValue(const PropertyListValue& other);
  PropertyListValue(PropertyListValue&& other) noexcept : payload(moved(other.payload)) {}
  PropertyListValue& operator=(const PropertyListValue& other);
  PropertyListValue& operator=(PropertyListValue&& other) noexcept;
  ~PropertyListValue() {
    if (payload.index() < 2) clearContainer();
  }

  /// The payload of the named case, or null.
  const Array* array() const { return std::get_if<Array>(&payload); }
  const Dictionary* dictionary() const { return std::get_if<Dictionary>(&payload); }
  const std::string* string() const { return std::get_if<std::string>(&payload); }
  const Data* data() const { return std::get_if<Data>(&payload); }
  const Date* date() const { return std::get_if<Date>(&payload); }
  const std::int64_t* integer() const { return std::get_if<std::int64_t>(&payload); }
  const double* floatingPoint() const { return std::get_if<double>(&payload); }
  const bool* boolean() const { return std::get_if<bool>(&payload); }

  bool operator==(const PropertyListValue& other) const;

  /// A value is its own property-list form.
  const PropertyListValue& propertyListValue() const { return *this; }

 private:
  /// What the variant's own move does, in code that compilers inline: readers move every value once.
  static Payload moved(Payload& payload) noexcept;
  void clearContainer() noexcept;
  void clearWithoutStack() noexcept;
  /// How many values a container holds; none in a scalar.
  std::size_t containedCount() const;
  /// A container's value at a place counted from 1 at its end.
  PropertyListValue& fromEnd(std::size_t place);
  void removeLast();
};

struct PropertyListDictionary::Entry {
  SharedString key;
  PropertyListValue value;

  Entry() = default;
  Entry(SharedString itsKey, PropertyListValue itsValue)
      : key(std::move(itsKey)), value(std::move(itsValue)) {}
  /// The value is made in place.
  template <class Case, class... Arguments>
  Entry(SharedString&& itsKey, std::in_place_type_t<Case> named, Arguments&&... arguments)
      : key(std::move(itsKey)), value(named, std::forward<Arguments>(arguments)...) {}
};

// Entries hold values, so what handles them has to wait until here.
inline PropertyListDictionary::PropertyListDictionary() noexcept = default;
inline PropertyListDictionary::PropertyListDictionary(PropertyListDictionary&&) noexcept = default;
inline PropertyListDictionary& PropertyListDictionary::operator=(PropertyListDictionary&&) noexcept = default;
inline PropertyListDictionary::~PropertyListDictionary() = default;
inline std::size_t PropertyListDictionary::size() const { return entries_.size(); }
inline bool PropertyListDictionary::empty() const { return entries_.empty(); }
inline PropertyListValue::Payload PropertyListValue::moved(Payload& payload) noexcept {
  switch (payload.index()) {
    case 0:
      return Payload(std::in_place_index<0>, std::move(*std::get_if<0>(&payload)));
    case 1:
      return Payload(std::in_place_index<1>, std::move(*std::get_if<1>(&payload)));
    case 2:
      return Payload(std::in_place_index<2>, std::move(*std::get_if<2>(&payload)));
    case 3:
      return Payload(std::in_place_index<3>, std::move(*std::get_if<3>(&payload)));
    case 4:
      return Payload(std::in_place_index<4>, *std::get_if<4>(&payload));
    case 5:
      return Payload(std::in_place_index<5>, *std::get_if<5>(&payload));
    case 6:
      return Payload(std::in_place_index<6>, *std::get_if<6>(&payload));
    default:
      return Payload(std::in_place_index<7>, *std::get_if<7>(&payload));
  }
}
inline PropertyListDictionary::Entries::const_iterator PropertyListDictionary::begin() const {
  return entries_.begin();
}
inline PropertyListDictionary::Entries::const_iterator PropertyListDictionary::end() const {
  return entries_.end();
}

/// The printed form: `integer(7)`, `string("X")`, `array([…])`, `dictionary(["k": …])`.
MARLET_EXPORT std::string description(const PropertyListValue& value);
/// The printed form of an optional value: `Optional(string("X"))`, or `nil` for null.
MARLET_EXPORT std::string optionalDescription(const PropertyListValue* value);

}  // namespace MarletFoundation
