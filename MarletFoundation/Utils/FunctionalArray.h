#pragma once

#include <algorithm>
#include <cstddef>
#include <functional>
#include <iterator>
#include <optional>
#include <type_traits>
#include <unordered_map>
#include <unordered_set>
#include <utility>
#include <vector>

#include "MarletFoundation/Platform/FatalError.h"

/// @file
/// Small functions on arrays and dictionaries. Indices count elements from 0.
namespace MarletFoundation {

/// Index of the first element for which `pred` is false, when all for which it is true stand first.
template <class T, class Predicate>
std::size_t lowerBound(const std::vector<T>& array, Predicate&& pred) {
  std::size_t start = 0;
  auto length = array.size();
  while (length > 0) {
    const auto half = length / 2;
    if (std::invoke(pred, array[start + half])) {
      start += half + 1;
      length -= half + 1;
    } else {
      length = half;
    }
  }
  return start;
}

/// Sorts the elements from index `start` up to `end` in place, keeping the order of equal ones. The number of
/// comparisons grows with the square of their number. A range outside of the collection is fatal.
template <class Collection, class StrictlyBefore>
void insertionSort(Collection& collection, std::size_t start, std::size_t end, StrictlyBefore&& before) {
  if (start > end || end > collection.size()) fatalError("range out of bounds");
  for (auto sorted = start; sorted < end; ++sorted) {
    for (auto i = sorted; i > start && std::invoke(before, collection[i], collection[i - 1]); --i) {
      using std::swap;
      swap(collection[i], collection[i - 1]);
    }
  }
}

/// A sorted copy, with equal elements in their order. Meant for short arrays: its time grows with the square
/// of the length.
template <class T, class StrictlyBefore>
std::vector<T> stableSort(std::vector<T> array, StrictlyBefore&& before) {
  insertionSort(array, 0, array.size(), before);
  return array;
}

/// `f` of what was gathered so far and the next element, from `initial` on.
template <class T, class Initial, class F>
Initial fold(const std::vector<T>& array, Initial initial, F&& f) {
  for (const auto& element : array) initial = std::invoke(f, std::move(initial), element);
  return initial;
}

/// The first element for which `predicate` holds.
template <class T, class Predicate>
std::optional<T> find(const std::vector<T>& array, Predicate&& predicate) {
  const auto found = std::find_if(array.begin(), array.end(), std::ref(predicate));
  return found == array.end() ? std::nullopt : std::optional<T>(*found);
}

/// The first element of each key, in the order of first sight; for each later one of its key, the kept
/// element is put through `mark`, and the later one is dropped.
template <class T, class Key, class Mark>
std::vector<T> dedupWithMark(const std::vector<T>& array, Key&& key, Mark&& mark) {
  std::unordered_map<std::remove_cvref_t<std::invoke_result_t<Key, const T&>>, std::size_t> indices;
  std::vector<T> kept;
  for (const auto& element : array) {
    const auto [entry, isNew] = indices.try_emplace(std::invoke(key, element), kept.size());
    if (isNew)
      kept.push_back(element);
    else
      kept[entry->second] = std::invoke(mark, std::as_const(kept[entry->second]));
  }
  return kept;
}

/// The first element of each key, in the order of first sight.
template <class T, class Key>
std::vector<T> dedup(const std::vector<T>& array, Key&& key) {
  std::unordered_set<std::remove_cvref_t<std::invoke_result_t<Key, const T&>>> seen;
  std::vector<T> kept;
  for (const auto& element : array) {
    if (seen.insert(std::invoke(key, element)).second) kept.push_back(element);
  }
  return kept;
}

/// The elements that don't occur in `others`, in their order.
template <class T>
std::vector<T> without(std::vector<T> array, const std::vector<T>& others) {
  std::erase_if(array, [&](const T& element) {
    return std::find(others.begin(), others.end(), element) != others.end();
  });
  return array;
}

/// The array turned left by `count` places, full turns left out. What remains to the right is fatal, but an
/// empty array stays empty.
template <class T>
std::vector<T> rotate(std::vector<T> array, std::ptrdiff_t count) {
  if (array.empty()) return array;
  const auto places = count % static_cast<std::ptrdiff_t>(array.size());
  if (places < 0) fatalError("range out of bounds");
  std::rotate(array.begin(), array.begin() + places, array.end());
  return array;
}

/// An array of one element.
template <class T>
std::vector<T> singleton(T x) {
  std::vector<T> array;
  array.push_back(std::move(x));
  return array;
}

/// Calls `f` with key and value of every entry, in the dictionary's order.
template <class Dictionary, class F>
requires requires { typename Dictionary::mapped_type; }
void each(const Dictionary& dictionary, F&& f) {
  for (const auto& [key, value] : dictionary) static_cast<void>(std::invoke(f, key, value));
}

/// The elements of a range, now: those of a lazy one are made here.
template <class Range>
auto toArray(Range&& range) {
  using std::begin;
  using std::end;
  std::vector<std::remove_cvref_t<decltype(*begin(range))>> array;
  for (auto&& element : range) array.push_back(std::forward<decltype(element)>(element));
  return array;
}

}  // namespace MarletFoundation
