#pragma once

#include "MarletFoundation/Data/PropertyListValue.h"

namespace MarletFoundation {

/// The children of an array or a dictionary, one after the other: what whoever walks a value keeps of each container
/// that is open, so that a value's depth costs memory and no stack. Holds as long as the value does.
class PropertyListChildren {
 public:
  explicit PropertyListChildren(const PropertyListValue& container)
      : isDictionary_(container.dictionary() != nullptr) {
    if (const auto* dictionary = container.dictionary()) {
      entry_ = dictionary->begin();
      entriesEnd_ = dictionary->end();
    } else {
      element_ = container.array()->data();
      elementsEnd_ = element_ + container.array()->size();
    }
  }

  bool isDictionary() const { return isDictionary_; }
  bool atEnd() const { return isDictionary_ ? entry_ == entriesEnd_ : element_ == elementsEnd_; }
  /// The key of the next child of a dictionary.
  std::string_view key() const { return entry_->key; }
  /// The next child; moves on.
  const PropertyListValue& next() { return isDictionary_ ? (entry_++)->value : *element_++; }

 private:
  bool isDictionary_;
  const PropertyListValue* element_ = nullptr;
  const PropertyListValue* elementsEnd_ = nullptr;
  PropertyListDictionary::Iterator entry_;
  PropertyListDictionary::Iterator entriesEnd_;
};

inline bool isPropertyListContainer(const PropertyListValue& value) { return value.payload.index() < 2; }

}  // namespace MarletFoundation
