#include "MarletFoundation/Logging/ActivityTracingEvent.h"

#include "MarletFoundation/Platform/JSONSerialization.h"

namespace MarletFoundation {

std::optional<ActivityTracingEvent::Category> ActivityTracingEvent::categoryFromRawValue(
    std::uint16_t value) {
  const auto last = static_cast<std::uint16_t>(Category::keyboard);
  return value >= 1 && value <= last ? std::optional(static_cast<Category>(value)) : std::nullopt;
}

std::optional<ActivityTracingEvent::EventType> ActivityTracingEvent::eventTypeFromRawValue(
    std::uint16_t value) {
  const auto last = static_cast<std::uint16_t>(EventType::suggestionTapped);
  return value >= 1 && value <= last ? std::optional(static_cast<EventType>(value)) : std::nullopt;
}

PropertyListObjectPointer objectOf(const ActivityTracingEvent::Data& data) {
  PropertyListObjects keys;
  PropertyListObjects values;
  for (const auto& [key, value] : data) {
    keys.push_back(std::make_shared<StringObject>(key));
    values.push_back(value ? value : std::make_shared<NullObject>());
  }
  return std::make_shared<PlainDictionary>(values, keys);
}

}  // namespace MarletFoundation
