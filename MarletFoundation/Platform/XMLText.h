#pragma once

#include <optional>
#include <string_view>

#include "MarletFoundation/Platform/Data.h"

namespace MarletFoundation {

/// An XML document in UTF-8, up to the first place that is refused before any markup is looked at.
struct XMLText {
  Data utf8;
  /// Why the document isn't read beyond that, in a sentence; nothing when it is all there.
  std::optional<std::string_view> refusal;
};

/// Finds the encoding of `document` from its byte-order mark or its declaration and converts it, if needed.
/// Stops where bytes are ill-formed in the encoding, and in front of a tag with more than 256 attributes.
XMLText xmlText(const Data& document);

}  // namespace MarletFoundation
