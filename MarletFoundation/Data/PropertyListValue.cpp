#include "MarletFoundation/Data/PropertyListValue.h"

#include <algorithm>

#include "MarletFoundation/Platform/Text.h"

namespace MarletFoundation {
namespace {

using Array = PropertyListValue::Array;
using Dictionary = PropertyListValue::Dictionary;
using Entry = PropertyListDictionary::Entry;

// How deep destructors may follow a value on the stack.
constexpr int clearDepthLimit = 64;
thread_local int clearDepth = 0;

// Where more entries than these lie behind a place in an array, none comes or goes there.
constexpr std::ptrdiff_t mostMoved = 64;

// A set gives its elements as constants, since their keys must stay. Values may change.
Entry& fromTree(const Entry& entry) { return const_cast<Entry&>(entry); }

bool isContainer(const PropertyListValue& value) { return value.payload.index() < 2; }

// The first bytes mostly tell.
bool isBefore(std::string_view a, std::string_view b) {
  if (a.empty() || b.empty() || a[0] == b[0]) return a < b;
  return static_cast<unsigned char>(a[0]) < static_cast<unsigned char>(b[0]);
}

bool equalScalars(const PropertyListValue& a, const PropertyListValue& b) {
  switch (a.payload.index()) {
    case 2:
      return *a.string() == *b.string();
    case 3:
      return *a.data() == *b.data();
    case 4:
      return *a.date() == *b.date();
    case 5:
      return *a.integer() == *b.integer();
    case 6:
      return *a.floatingPoint() == *b.floatingPoint();
    default:
      return *a.boolean() == *b.boolean();
  }
}

}  // namespace

PropertyListDictionary::PropertyListDictionary(const PropertyListDictionary& other) {
  entries_.reserve(other.size());
  for (const auto& entry : other) entries_.push_back(entry);
}

PropertyListDictionary& PropertyListDictionary::operator=(const PropertyListDictionary& other) {
  return *this = PropertyListDictionary(other);
}

PropertyListDictionary::PropertyListDictionary(
    std::initializer_list<std::pair<std::string_view, PropertyListValue>> entries) {
  entries_.reserve(entries.size());
  for (const auto& [key, value] : entries) entries_.push_back({SharedString(key), value});
  sortEntries();
}

PropertyListDictionary::PropertyListDictionary(Entries entries) : entries_(std::move(entries)) {
  sortEntries();
}

void PropertyListDictionary::sortEntries() {
  const auto notAscending = [](const Entry& a, const Entry& b) { return !isBefore(a.key, b.key); };
  if (std::adjacent_find(entries_.begin(), entries_.end(), notAscending) == entries_.end()) return;
  std::stable_sort(entries_.begin(), entries_.end(),
                   [](const Entry& a, const Entry& b) { return a.key.view() < b.key.view(); });
  // Of equal keys the last stays: walking backwards, unique keeps the first that it meets.
  const auto sameKey = [](const Entry& a, const Entry& b) { return a.key.view() == b.key.view(); };
  const auto kept = std::unique(entries_.rbegin(), entries_.rend(), sameKey);
  entries_.erase(entries_.begin(), kept.base());
}

const PropertyListValue* PropertyListDictionary::find(std::string_view key) const {
  if (tree_) {
    const auto found = tree_->find(key);
    return found == tree_->end() ? nullptr : &found->value;
  }
  // In a few keys, the right one is found sooner by its length than by order.
  constexpr std::size_t few = 12;
  if (entries_.size() <= few) {
    for (const auto& entry : entries_) {
      if (entry.key.view() == key) return &entry.value;
    }
    return nullptr;
  }
  const auto found = std::lower_bound(entries_.begin(), entries_.end(), key, Before());
  return found != entries_.end() && found->key.view() == key ? &found->value : nullptr;
}

PropertyListValue* PropertyListDictionary::find(std::string_view key) {
  return const_cast<PropertyListValue*>(std::as_const(*this).find(key));
}

PropertyListValue& PropertyListDictionary::operator[](std::string_view key) {
  if (auto* const value = find(key)) return *value;
  const auto place =
      tree_ ? entries_.end() : std::lower_bound(entries_.begin(), entries_.end(), key, Before());
  if (entries_.end() - place > mostMoved) growTree();
  if (!tree_) return entries_.insert(place, {SharedString(key), PropertyListValue()})->value;
  return fromTree(*tree_->emplace(SharedString(key), PropertyListValue()).first).value;
}

bool PropertyListDictionary::erase(std::string_view key) {
  if (!contains(key)) return false;
  const auto place =
      tree_ ? entries_.end() : std::lower_bound(entries_.begin(), entries_.end(), key, Before());
  if (entries_.end() - place > mostMoved) growTree();
  if (tree_) {
    tree_->erase(tree_->find(key));
  } else {
    entries_.erase(place);
  }
  return true;
}

// The nodes come first: once they are there, nothing can fail any more.
void PropertyListDictionary::growTree() {
  auto tree = std::make_unique<Tree>();
  for (const auto& entry : entries_) tree->emplace_hint(tree->end(), entry.key, PropertyListValue());
  auto node = tree->begin();
  for (auto& entry : entries_) fromTree(*node++).value = std::move(entry.value);
  entries_ = Entries();
  tree_ = std::move(tree);
}

Entry& PropertyListDictionary::fromEnd(std::size_t place) {
  if (!tree_) return entries_.end()[-static_cast<std::ptrdiff_t>(place)];
  return fromTree(*std::next(tree_->rbegin(), static_cast<std::ptrdiff_t>(place) - 1));
}

void PropertyListDictionary::removeLast() {
  if (!tree_) return entries_.pop_back();
  tree_->erase(std::prev(tree_->end()));
}

void PropertyListDictionary::clear() noexcept {
  entries_.clear();
  tree_.reset();
}

bool PropertyListDictionary::operator==(const PropertyListDictionary& other) const {
  return size() == other.size() &&
         std::equal(begin(), end(), other.begin(), [](const Entry& a, const Entry& b) {
           return a.key.view() == b.key.view() && a.value == b.value;
         });
}

PropertyListValue::PropertyListValue(Array value) : payload(std::move(value)) {}
PropertyListValue::PropertyListValue(Dictionary value) : payload(std::move(value)) {}

PropertyListValue::PropertyListValue(const PropertyListValue& other) {
  if (!isContainer(other)) {
    payload = other.payload;
    return;
  }
  // Each container is given its final room before it is filled, so the places to be filled stay where they
  // are.
  std::vector<std::pair<const PropertyListValue*, PropertyListValue*>> open{{&other, this}};
  const auto copyChild = [&open](const PropertyListValue& child, PropertyListValue& place) {
    if (isContainer(child)) {
      open.emplace_back(&child, &place);
    } else {
      place.payload = child.payload;
    }
  };
  while (!open.empty()) {
    const auto [source, target] = open.back();
    open.pop_back();
    if (const auto* from = source->array()) {
      auto& to = target->payload.emplace<Array>(from->size());
      for (std::size_t i = 0; i < from->size(); ++i) copyChild((*from)[i], to[i]);
    } else {
      auto& to = target->payload.emplace<Dictionary>().entries_;
      to.reserve(source->dictionary()->size());
      for (const auto& [key, value] : *source->dictionary()) {
        auto& entry = to.emplace_back();
        entry.key = key;
        copyChild(value, entry.value);
      }
    }
  }
}

PropertyListValue& PropertyListValue::operator=(const PropertyListValue& other) {
  return *this = PropertyListValue(other);
}

PropertyListValue& PropertyListValue::operator=(PropertyListValue&& other) noexcept {
  // `other` may lie within this value, which therefore lives until the end.
  const PropertyListValue old(std::move(*this));
  payload = std::move(other.payload);
  return *this;
}

void PropertyListValue::clearContainer() noexcept {
  auto* const array = std::get_if<Array>(&payload);
  auto* const dictionary = std::get_if<Dictionary>(&payload);
  // Mostly nothing lies deeper, and depth needn't be looked at.
  const auto holdsContainer = [](const PropertyListValue& value) { return isContainer(value); };
  const auto isDeep = [](const Entry& entry) { return isContainer(entry.value); };
  const bool isDeeper = array ? std::any_of(array->begin(), array->end(), holdsContainer)
                              : std::any_of(dictionary->begin(), dictionary->end(), isDeep);
  if (!isDeeper) return;
  if (clearDepth == clearDepthLimit) return clearWithoutStack();
  ++clearDepth;
  if (array) {
    array->clear();
  } else {
    dictionary->clear();
  }
  --clearDepth;
}

std::size_t PropertyListValue::containedCount() const {
  if (const auto* values = array()) return values->size();
  return dictionary() ? dictionary()->size() : 0;
}

PropertyListValue& PropertyListValue::fromEnd(std::size_t place) {
  if (auto* const values = std::get_if<Array>(&payload))
    return values->end()[-static_cast<std::ptrdiff_t>(place)];
  return std::get<Dictionary>(payload).fromEnd(place).value;
}

void PropertyListValue::removeLast() {
  if (auto* const values = std::get_if<Array>(&payload)) return values->pop_back();
  std::get<Dictionary>(payload).removeLast();
}

/// A destructor has no memory to ask for: the last place of each container that was entered holds the one around it.
void PropertyListValue::clearWithoutStack() noexcept {
  PropertyListValue value = std::move(*this), around;
  while (true) {
    while (value.containedCount() > 0) {
      auto last = std::move(value.fromEnd(1));
      value.fromEnd(1) = std::move(around);
      around = std::move(value);
      value = std::move(last);
    }
    while (around.containedCount() == 1) {
      auto next = std::move(around.fromEnd(1));
      around.removeLast();
      around = std::move(next);
    }
    if (around.containedCount() == 0) return;
    value = std::move(around.fromEnd(2));
    around.fromEnd(2) = std::move(around.fromEnd(1));
    around.removeLast();
  }
}

bool PropertyListValue::operator==(const PropertyListValue& other) const {
  std::vector<std::pair<const PropertyListValue*, const PropertyListValue*>> open;
  const auto differ = [&open](const PropertyListValue& a, const PropertyListValue& b) {
    if (a.payload.index() != b.payload.index()) return true;
    if (!isContainer(a)) return !equalScalars(a, b);
    open.emplace_back(&a, &b);
    return false;
  };
  if (differ(*this, other)) return false;
  while (!open.empty()) {
    const auto [a, b] = open.back();
    open.pop_back();
    if (const auto* first = a->array()) {
      const auto* second = b->array();
      if (first->size() != second->size()) return false;
      for (std::size_t i = 0; i < first->size(); ++i) {
        if (differ((*first)[i], (*second)[i])) return false;
      }
    } else {
      if (a->dictionary()->size() != b->dictionary()->size()) return false;
      auto theirs = b->dictionary()->begin();
      for (const auto& entry : *a->dictionary()) {
        if (entry.key.view() != theirs->key.view() || differ(entry.value, theirs->value)) return false;
        ++theirs;
      }
    }
  }
  return true;
}

}  // namespace MarletFoundation
