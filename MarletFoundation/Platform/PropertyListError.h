#pragma once

#include <optional>

#include "MarletFoundation/Platform/ErrorObject.h"

namespace MarletFoundation {

/// The domain of what the property-list readers and writers throw; the code is a `PropertyListErrorCode`.
inline constexpr std::string_view PropertyListErrorDomain = "MarletFoundation.PropertyListSerialization";
/// Where in the input a reader's error lies, in bytes from its start.
inline constexpr std::string_view ByteOffsetKey = "ByteOffset";

/// What can be wrong with a property list. The numbers stay the same between releases.
enum class PropertyListErrorCode {
  unknownFormat = 1,
  // 2 was for depth, which has no limit any more.
  integerOutOfRange = 3,
  // XML
  invalidEncoding,
  unsupportedEncoding,
  invalidCharacter,
  unexpectedEnd,
  malformedMarkup,
  entityDeclaration,
  unknownEntity,
  invalidCharacterReference,
  unknownElement,
  misplacedElement,
  mismatchedTag,
  misplacedText,
  missingValue,
  missingKey,
  missingRoot,
  secondRoot,
  invalidInteger,
  invalidReal,
  invalidDate,
  invalidData,
  // binary
  truncated,
  invalidTrailer,
  invalidOffset,
  invalidReference,
  unsupportedObject,
  invalidObject,
  lengthOutOfRange,
  invalidString,
  keyNotString,
  cycle,
  tooMuchSharing,
  // writing
  unwritableText,
  unwritableDate,
};

/// The error with the words of its case, the detail that follows them, and its place in the input.
ErrorObject propertyListError(PropertyListErrorCode code, std::string_view detail = {},
                              std::optional<std::size_t> byteOffset = {},
                              std::optional<std::size_t> line = {});

}  // namespace MarletFoundation
