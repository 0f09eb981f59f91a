#pragma once

#include <cstddef>

#include "MarletFoundation/Platform/Export.h"

namespace MarletFoundation {

/// Counts what this thread's readers and writers of property lists do that hostile input might multiply: bytes that
/// are searched, places of a table that are looked at. Tests hold by it that this grows with the input alone.
void countPropertyListWork(std::size_t steps) noexcept;
/// What was counted since the last call.
MARLET_EXPORT std::size_t takePropertyListWork() noexcept;

}  // namespace MarletFoundation
