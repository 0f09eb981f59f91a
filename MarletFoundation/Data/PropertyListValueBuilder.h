#pragma once

#include <array>
#include <vector>

#include "MarletFoundation/Data/PropertyListValue.h"
#include "MarletFoundation/Platform/PropertyListEvents.h"

namespace MarletFoundation {

/// Makes a value of a reader's events. The children of open containers lie on two stacks, from which each
/// container takes its own, in one allocation of the right size, when it ends.
class PropertyListValueBuilder final : public PropertyListEvents {
 public:
  void beginArray() override { begin(false, values_.size()); }
  void beginDictionary() override { begin(true, entries_.size()); }
  void end() override;
  void key(std::string_view text) override;
  void string(std::string_view text) override { add<std::string>(text); }
  void data(Data bytes) override { add<Data>(std::move(bytes)); }
  void date(Date date) override { add<Date>(date); }
  void integer(std::int64_t number) override { add<std::int64_t>(number); }
  void real(double number) override { add<double>(number); }
  void boolean(bool flag) override { add<bool>(flag); }

  /// The value, once the reader is done.
  PropertyListValue take() { return std::move(values_.back()); }
  /// Forgets all values, so that another list can be read; keeps the keys, which lists of a kind have in common,
  /// and what memory isn't large.
  void clear();

 private:
  struct OpenContainer {
    bool isDictionary;
    // Where its children begin on their stack.
    std::size_t start;
    // The key that it stands under.
    SharedString key;
  };

  void begin(bool isDictionary, std::size_t start) {
    open_.push_back({isDictionary, start, std::move(key_)});
  }

  template <class Payload, class Argument>
  void add(Argument&& argument) {
    if (!open_.empty() && open_.back().isDictionary) {
      entries_.emplace_back(std::move(key_), std::in_place_type<Payload>, std::forward<Argument>(argument));
    } else {
      values_.emplace_back(std::in_place_type<Payload>, std::forward<Argument>(argument));
    }
  }
  const SharedString& sharedKey(std::string_view text);

  std::vector<OpenContainer> open_;
  std::vector<PropertyListValue> values_;
  std::vector<PropertyListDictionary::Entry> entries_;
  // The key of the value that follows.
  SharedString key_;
  // The keys met last, each in the place that its text hashes to.
  std::array<SharedString, 256> recentKeys_;
};

}  // namespace MarletFoundation
