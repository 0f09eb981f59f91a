#pragma once

#include <span>
#include <string>

#include "MarletFoundation/Platform/URL.h"

namespace MarletFoundation {

/// 28 lower-case letters that stand for strings, made from the MD5 of their bytes one after the other.
MARLET_EXPORT std::string mlf_uniqueStringWithDistinguishingStrings(std::span<const std::string> strings);

/// A short name for a document, made from where it lies. For one in the user's documents directory only its
/// place in there counts, so that the name outlives a move of that directory. A URL without a path is a fatal
/// error.
MARLET_EXPORT std::string pathUniquifier(const URL& url);

}  // namespace MarletFoundation
