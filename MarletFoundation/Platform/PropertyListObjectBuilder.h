#pragma once

#include "MarletFoundation/Platform/PropertyListEvents.h"
#include "MarletFoundation/Platform/PropertyListObject.h"

namespace MarletFoundation {

/// Makes an object of events: of a reader's, or of those that walk a value.
class PropertyListObjectBuilder final : public PropertyListEvents {
 public:
  enum class Dictionaries { plain, sorted };
  explicit PropertyListObjectBuilder(Dictionaries dictionaries) : dictionaries_(dictionaries) {}

  void beginArray() override { open_.emplace_back().isDictionary = false; }
  void beginDictionary() override { open_.emplace_back().isDictionary = true; }
  void end() override;
  void key(std::string_view text) override;
  void string(std::string_view text) override;
  void data(Data bytes) override;
  void date(Date date) override;
  void integer(std::int64_t number) override;
  void real(double number) override;
  void boolean(bool flag) override;

  /// The object, once the last event was sent.
  PropertyListObjectPointer take() { return std::move(root_); }

 private:
  struct OpenContainer {
    bool isDictionary = false;
    PropertyListObjects keys;
    PropertyListObjects values;
  };

  void add(PropertyListObjectPointer object);

  Dictionaries dictionaries_;
  std::vector<OpenContainer> open_;
  PropertyListObjectPointer root_;
};

}  // namespace MarletFoundation
