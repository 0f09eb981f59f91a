#include "MarletFoundation/Data/PropertyListValueBuilder.h"

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

}  // namespace

void PropertyListValueBuilder::end() {
  const auto [isDictionary, start] = open_.back();
  open_.pop_back();
  if (isDictionary) {
    add(PropertyListDictionary(taken(entries_, start)));
  } else {
    add(taken(values_, start));
  }
}

void PropertyListValueBuilder::key(std::string_view text) {
  entries_.push_back({sharedKey(text), PropertyListValue()});
}

const PropertyListKey& PropertyListValueBuilder::sharedKey(std::string_view text) {
  std::uint32_t hash = 2166136261;
  for (const char c : text) hash = (hash ^ static_cast<unsigned char>(c)) * 16777619;
  auto& recent = recentKeys_[(hash ^ hash >> 16) % recentKeys_.size()];
  if (!recent || recent->view() != text) recent.emplace(text);
  return *recent;
}

}  // namespace MarletFoundation
