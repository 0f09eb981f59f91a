#include "MarletFoundation/Platform/PropertyListError.h"

namespace MarletFoundation {
namespace {

std::string_view words(PropertyListErrorCode code) {
  using enum PropertyListErrorCode;
  switch (code) {
    case unknownFormat:
      return "The data is neither an XML nor a binary property list";
    case integerOutOfRange:
      return "An integer does not fit in 64 bits with sign";
    case invalidEncoding:
      return "The text is not valid in its encoding";
    case unsupportedEncoding:
      return "The declared encoding is not supported";
    case invalidCharacter:
      return "A character is not allowed in XML";
    case unexpectedEnd:
      return "The document ends too early";
    case malformedMarkup:
      return "The markup is malformed";
    case entityDeclaration:
      return "A document type with declarations is not allowed";
    case unknownEntity:
      return "An entity is not known";
    case invalidCharacterReference:
      return "A character reference names no character";
    case unknownElement:
      return "An element is not of property lists";
    case misplacedElement:
      return "An element stands where it may not";
    case mismatchedTag:
      return "An end tag does not match its start tag";
    case misplacedText:
      return "Text stands between elements";
    case missingValue:
      return "A key has no value";
    case missingKey:
      return "A value in a dictionary has no key";
    case missingRoot:
      return "The document holds no value";
    case secondRoot:
      return "The document holds more than one value";
    case invalidInteger:
      return "An integer is malformed";
    case invalidReal:
      return "A real number is malformed";
    case invalidDate:
      return "A date is malformed or does not exist";
    case invalidData:
      return "Data is not valid base64";
    case truncated:
      return "The data is too short to be a binary property list";
    case invalidTrailer:
      return "The trailer is inconsistent";
    case invalidOffset:
      return "An object's offset lies outside the object area";
    case invalidReference:
      return "A reference names no object";
    case unsupportedObject:
      return "An object is of a kind that values have no case for";
    case invalidObject:
      return "An object is of unknown kind or size";
    case lengthOutOfRange:
      return "An object is longer than what remains of the object area";
    case invalidString:
      return "A string is not valid in its encoding";
    case keyNotString:
      return "A dictionary's key is not a string";
    case cycle:
      return "A container contains itself";
    case tooMuchSharing:
      return "Shared objects would expand without measure";
    case unwritableText:
      return "A text cannot be written";
    case unwritableDate:
      return "A date cannot be written";
  }
  return {};
}

}  // namespace

ErrorObject propertyListError(PropertyListErrorCode code, std::string_view detail,
                              std::optional<std::size_t> byteOffset, std::optional<std::size_t> line) {
  std::string message(words(code));
  if (!detail.empty()) message.append(": ").append(detail);
  if (line) message += ", line " + std::to_string(*line);
  if (byteOffset) message += ", byte " + std::to_string(*byteOffset);
  UserInfo info{{std::string(LocalizedDescriptionKey), message + "."}};
  if (byteOffset) info.emplace(ByteOffsetKey, static_cast<std::int64_t>(*byteOffset));
  if (line) info.emplace(LineKey, static_cast<std::int64_t>(*line));
  return {std::string(PropertyListErrorDomain), static_cast<int>(code), std::move(info)};
}

}  // namespace MarletFoundation
