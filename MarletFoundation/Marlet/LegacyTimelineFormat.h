#pragma once

#include "MarletFoundation/Marlet/MarletInlineResultData.h"
#include "MarletFoundation/Platform/Data.h"

namespace MarletFoundation {

/// The timeline file of an older editor. The text of all items comes from
/// `MarletInlineResultData::legacyTimelineItemString`.
std::string legacyTimeline(const InlineResults& results);

/// The results of a timeline file, as far as it can be read. Items without a place are passed over, and of two
/// on one line the later one counts.
InlineResults inlineResultsFromLegacyTimeline(const Data& data);

}  // namespace MarletFoundation
