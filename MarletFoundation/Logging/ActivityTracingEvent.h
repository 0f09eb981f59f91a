#pragma once

#include <cstdint>
#include <map>
#include <optional>
#include <string>

#include "MarletFoundation/Platform/Export.h"
#include "MarletFoundation/Platform/PropertyListObject.h"

namespace MarletFoundation {

/// What a learner did. The raw values are what is sent.
struct MARLET_EXPORT ActivityTracingEvent {
  using Data = std::map<std::string, PropertyListObjectPointer>;

  enum class Category : std::uint16_t { page = 1, document, keyboard };
  enum class EventType : std::uint16_t {
    opened = 1,
    closed,
    reset,
    issues,
    assessed,
    hintAccessed,
    solutionTapped,
    hidden,
    visible,
    suggestionTapped,
  };

  Category category;
  EventType type;
  Data data;

  /// Nothing for a raw value that none has.
  static std::optional<Category> categoryFromRawValue(std::uint16_t rawValue);
  static std::optional<EventType> eventTypeFromRawValue(std::uint16_t rawValue);
};

/// An event's data as one object; null stands for null.
MARLET_EXPORT PropertyListObjectPointer objectOf(const ActivityTracingEvent::Data& data);

}  // namespace MarletFoundation
