#pragma once

#include <concepts>
#include <cstdint>
#include <initializer_list>
#include <iterator>
#include <memory>
#include <set>
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

/// A dictionary from string to value in ascending key order (by code point): lookup is logarithmic, iteration
/// sorted. It is kept as one array, so that a large one costs one allocation, until keys come or go one by one
/// within a large one: from then on as a tree, so that filling and emptying takes n log n.
class MARLET_EXPORT PropertyListDictionary {
 public:
  struct Entry;
  class Iterator;
  using Entries = std::vector<Entry>;
  using iterator = Iterator;
  using const_iterator = Iterator;

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

  Iterator begin() const;
  Iterator end() const;
  bool operator==(const PropertyListDictionary& other) const;

 private:
  friend struct PropertyListValue;
  struct Before;
  using Tree = std::set<Entry, Before>;

  void sortEntries();
  /// Moves the entries from the array to a tree.
  void growTree();
  /// The `place`th entry from the end, counted from 1: one of the last two.
  Entry& fromEnd(std::size_t place);
  void removeLast();
  void clear() noexcept;

  // All of them, or none once there is a tree.
  Entries entries_;
  std::unique_ptr<Tree> tree_;
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
  PropertyListValue(std::nullptr_t) = delete;
  PropertyListValue(Data value) : payload(std::move(value)) {}
  PropertyListValue(Date value) : payload(value) {}
  template <std::integral Integer>
  requires(!std::same_as<Integer, bool>) PropertyListValue(Integer value)
      : payload(static_cast<std::int64_t>(value)) {}
  template <std::floating_point Real>
  PropertyListValue(Real value) : payload(static_cast<double>(value)) {}
  /// Only `bool` itself: a pointer is none.
  template <std::same_as<bool> Boolean>
  PropertyListValue(Boolean value) : payload(value) {}
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

struct PropertyListDictionary::Before {
  using is_transparent = void;
  bool operator()(const Entry& a, const Entry& b) const { return a.key.view() < b.key.view(); }
  bool operator()(const Entry& a, std::string_view b) const { return a.key.view() < b; }
  bool operator()(std::string_view a, const Entry& b) const { return a < b.key.view(); }
};

/// Walks the entries in ascending order of their keys. It holds until the dictionary changes.
class PropertyListDictionary::Iterator {
 public:
  using iterator_category = std::forward_iterator_tag;
  using value_type = Entry;
  using difference_type = std::ptrdiff_t;
  using pointer = const Entry*;
  using reference = const Entry&;

  Iterator() = default;
  explicit Iterator(const Entry* entry) : entry_(entry) {}
  explicit Iterator(Tree::const_iterator node) : node_(node) {}

  reference operator*() const { return entry_ ? *entry_ : *node_; }
  pointer operator->() const { return &**this; }
  Iterator& operator++() {
    if (entry_) {
      ++entry_;
    } else {
      ++node_;
    }
    return *this;
  }
  Iterator operator++(int) {
    auto before = *this;
    ++*this;
    return before;
  }
  bool operator==(const Iterator&) const = default;

 private:
  // In an array, else null.
  const Entry* entry_ = nullptr;
  Tree::const_iterator node_{};
};

// Entries hold values, so what handles them has to wait until here.
inline PropertyListDictionary::PropertyListDictionary() noexcept = default;
inline PropertyListDictionary::PropertyListDictionary(PropertyListDictionary&&) noexcept = default;
inline PropertyListDictionary& PropertyListDictionary::operator=(PropertyListDictionary&& other) noexcept {
  // `other` may lie within this dictionary, which therefore lives until the end.
  auto taken = std::move(other);
  std::swap(entries_, taken.entries_);
  std::swap(tree_, taken.tree_);
  return *this;
}
inline PropertyListDictionary::~PropertyListDictionary() = default;
inline std::size_t PropertyListDictionary::size() const { return tree_ ? tree_->size() : entries_.size(); }
inline bool PropertyListDictionary::empty() const { return size() == 0; }
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
inline PropertyListDictionary::Iterator PropertyListDictionary::begin() const {
  return tree_ ? Iterator(tree_->begin()) : Iterator(entries_.data());
}
inline PropertyListDictionary::Iterator PropertyListDictionary::end() const {
  return tree_ ? Iterator(tree_->end()) : Iterator(entries_.data() + entries_.size());
}

/// The printed form: `integer(7)`, `string("X")`, `array([…])`, `dictionary(["k": …])`.
MARLET_EXPORT std::string description(const PropertyListValue& value);
/// The printed form of an optional value: `Optional(string("X"))`, or `nil` for null.
MARLET_EXPORT std::string optionalDescription(const PropertyListValue* value);

}  // namespace MarletFoundation
