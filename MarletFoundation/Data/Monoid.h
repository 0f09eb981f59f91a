#pragma once

#include <concepts>
#include <iterator>
#include <map>
#include <set>
#include <type_traits>
#include <unordered_map>
#include <unordered_set>
#include <utility>
#include <vector>

#include "MarletFoundation/Data/PropertyListValue.h"

namespace MarletFoundation {

/// Concatenation.
template <class T>
std::vector<T> mappend(std::vector<T> self, const std::vector<T>& other) {
  self.insert(self.end(), other.begin(), other.end());
  return self;
}

/// Both dictionaries in one; on a shared key the value of `other` wins.
template <class Key, class Value, class Order>
std::map<Key, Value, Order> mappend(std::map<Key, Value, Order> self,
                                    const std::map<Key, Value, Order>& other) {
  for (const auto& [key, value] : other) self.insert_or_assign(key, value);
  return self;
}
template <class Key, class Value, class Hash, class Equal>
std::unordered_map<Key, Value, Hash, Equal> mappend(
    std::unordered_map<Key, Value, Hash, Equal> self,
    const std::unordered_map<Key, Value, Hash, Equal>& other) {
  for (const auto& [key, value] : other) self.insert_or_assign(key, value);
  return self;
}
inline PropertyListDictionary mappend(const PropertyListDictionary& self,
                                      const PropertyListDictionary& other) {
  PropertyListDictionary::Entries entries(self.begin(), self.end());
  entries.insert(entries.end(), other.begin(), other.end());
  return PropertyListDictionary(std::move(entries));
}

/// Union.
template <class T, class Order>
std::set<T, Order> mappend(std::set<T, Order> self, const std::set<T, Order>& other) {
  self.insert(other.begin(), other.end());
  return self;
}
template <class T, class Hash, class Equal>
std::unordered_set<T, Hash, Equal> mappend(std::unordered_set<T, Hash, Equal> self,
                                           const std::unordered_set<T, Hash, Equal>& other) {
  self.insert(other.begin(), other.end());
  return self;
}

/// A type with an empty element, its default value, and a combination, `mappend(self, other)`, which is
/// looked up beside the type.
template <class M>
concept Monoid = std::default_initializable<M> && std::copyable<M> &&
    requires(const M& self, const M& other) {
  { mappend(self, other) } -> std::same_as<M>;
};

/// The empty element: it changes nothing that it is combined with.
template <Monoid M>
M empty() {
  return M();
}

template <class A>
std::vector<A> point(std::type_identity<std::vector<A>>, A element) {
  return {std::move(element)};
}
template <class A>
std::set<A> point(std::type_identity<std::set<A>>, A element) {
  return {std::move(element)};
}

/// A container that can be built around one element, by `point(std::type_identity<P>(), element)`, which is
/// looked up beside the type.
template <class P>
concept Pointed = requires(typename P::value_type element) {
  { point(std::type_identity<P>(), std::move(element)) } -> std::same_as<P>;
};

template <Pointed P>
P point(typename P::value_type element) {
  return point(std::type_identity<P>(), std::move(element));
}

/// The first `count` elements in a new value of the same type; all of them when there are fewer.
template <class S>
requires Monoid<S> && Pointed<S> S take(const S& sequence, std::ptrdiff_t count) {
  auto taken = empty<S>();
  for (auto element = sequence.begin(); element != sequence.end() && count > 0; ++element, --count)
    taken = mappend(std::move(taken), point<S>(*element));
  return taken;
}

}  // namespace MarletFoundation
