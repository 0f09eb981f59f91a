#pragma once

#include <array>
#include <optional>
#include <vector>

#include "MarletFoundation/Data/PropertyListValue.h"
#include "MarletFoundation/Platform/PropertyListEvents.h"

namespace MarletFoundation {

/// Makes a value of a reader's events. The children of open containers lie on two stacks, from which each
/// container takes its own, in one allocation of the right size, when it ends.
class PropertyListValueBuilder final : public PropertyListEvents {
 public:
  void beginArray() override { open_.push_back({false, values_.size()}); }
  void beginDictionary() override { open_.push_back({true, entries_.size()}); }
  void end() override;
  void key(std::string_view text) override;
  void string(std::string_view text) override { add(text); }
  void data(Data bytes) override { add(std::move(bytes)); }
  void date(Date date) override { add(date); }
  void integer(std::int64_t number) override { add(number); }
  void real(double number) override { add(number); }
  void boolean(bool flag) override { add(flag); }

  /// The value, once the reader is done.
  PropertyListValue take() { return std::move(values_.back()); }

 private:
  struct OpenContainer {
    bool isDictionary;
    // Where its children begin on their stack.
    std::size_t start;
  };

  template <class Payload>
  void add(Payload&& payload) {
    if (!open_.empty() && open_.back().isDictionary) {
      entries_.back().value = PropertyListValue(std::forward<Payload>(payload));
    } else {
      values_.emplace_back(std::forward<Payload>(payload));
    }
  }
  const PropertyListKey& sharedKey(std::string_view text);

  std::vector<OpenContainer> open_;
  std::vector<PropertyListValue> values_;
  std::vector<PropertyListDictionary::Entry> entries_;
  // The keys met last, each in the place that its text hashes to.
  std::array<std::optional<PropertyListKey>, 256> recentKeys_;
};

}  // namespace MarletFoundation
