#pragma once

#include <string>
#include <string_view>

#include "MarletFoundation/Platform/Error.h"

/// What an error says in its own words, or, of one that has none, in those of its case:
/// `InvalidLiveViewMode("x")` as `Invalid live view mode: "x"`. Notes when it is want of memory.
std::string wordsOf(const MarletFoundation::Error& error);
/// The same, followed by the recovery suggestion where there is one.
std::string wordsWithSuggestion(const MarletFoundation::Error& error);
/// The suggestion as it follows those words.
std::string suggested(std::string_view words, const std::string& suggestion);
