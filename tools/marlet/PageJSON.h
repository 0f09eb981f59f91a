#pragma once

#include <nlohmann/json.hpp>

#include "MarletFoundation/Marlet/PageType.h"

/// What a page holds, without the keys that its kind has not. Throws `NotRepresentable` for numbers that are
/// not finite.
nlohmann::ordered_json json(const MarletFoundation::BookPageSnapshotType& page);
