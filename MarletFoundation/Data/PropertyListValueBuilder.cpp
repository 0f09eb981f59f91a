#include "MarletFoundation/Data/PropertyListValueBuilder.h"

#include <cstring>
#include <iterator>

namespace MarletFoundation {
namespace {

// What stands on the stack from `start` on, in an array of exactly its size.
template <class Element>
std::vector<Element> taken(std::vector<Element>& stack, std::size_t start) {
  const auto first = stack.begin() + static_cast<std::ptrdiff_t>(start);
  std::vector<Element> elements(std::make_move_iterator(first), std::make_move_iterator(stack.end()));
  stack.erase(first, stack.end());
  return elements;
}

// Keys are short and differ at their ends, so the first and last eight bytes will do.
std::size_t hash(std::string_view text) {
  std::uint64_t first = 0;
  std::uint64_t last = 0;
  if (text.size() >= 8) {
    std::memcpy(&first, text.data(), 8);
    std::memcpy(&last, text.data() + text.size() - 8, 8);
  } else if (!text.empty()) {
    std::memcpy(&first, text.data(), text.size());
  }
  const auto mixed = (first ^ last * 0x9E3779B97F4A7C15 ^ text.size()) * 0xD6E8FEB86659FD93;
  return static_cast<std::size_t>(mixed >> 32);
}

// Of short keys, the same bytes that were hashed are all.
bool isEqual(std::string_view a, std::string_view b) {
  if (a.size() != b.size()) return false;
  if (a.size() < 8 || a.size() > 16) return a == b;
  return std::memcmp(a.data(), b.data(), 8) == 0 &&
         std::memcmp(a.data() + a.size() - 8, b.data() + b.size() - 8, 8) == 0;
}

template <class Element>
void clearStack(std::vector<Element>& stack) {
  constexpr std::size_t mostKept = 1024;
  stack.clear();
  if (stack.capacity() > mostKept) stack.shrink_to_fit();
}

// A longer key isn't worth keeping for others that might equal it.
constexpr std::size_t longestSharedKey = 64;

}  // namespace

void PropertyListValueBuilder::clear() {
  clearStack(open_);
  clearStack(values_);
  clearStack(entries_);
}

void PropertyListValueBuilder::end() {
  const auto isDictionary = open_.back().isDictionary;
  const auto start = open_.back().start;
  key_ = std::move(open_.back().key);
  open_.pop_back();
  if (isDictionary) {
    add<PropertyListDictionary>(taken(entries_, start));
  } else {
    add<PropertyListValue::Array>(taken(values_, start));
  }
}

void PropertyListValueBuilder::key(std::string_view text) {
  key_ = text.size() > longestSharedKey ? SharedString(text) : sharedKey(text);
}

const SharedString& PropertyListValueBuilder::sharedKey(std::string_view text) {
  auto& recent = recentKeys_[hash(text) % recentKeys_.size()];
  if (!isEqual(recent.view(), text)) recent = SharedString(text);
  return recent;
}

}  // namespace MarletFoundation
