#include "MarletFoundation/SourceAnnotations/SourceTag.h"

#include "MarletFoundation/Platform/Text.h"

namespace MarletFoundation {
namespace {

constexpr std::string_view tagNames[] = {
    "multiLineFieldStart",        "inlineFieldStart",        "inlineFieldEnd",
    "multiLineCopySourceStart",   "inlineCopySourceStart",   "multiLineCopyDestinationStart",
    "inlineCopyDestinationStart", "codeCompletionDirective", "multiLineFieldEnd",
    "multiLineCopySourceEnd",     "inlineCopySourceEnd",     "multiLineCopyDestinationEnd",
    "inlineCopyDestinationEnd",   "hiddenCodeStart",         "hiddenCodeEnd",
};
static_assert(std::size(tagNames) == std::variant_size_v<SourceTag::Payload>);

constexpr std::string_view errorNames[] = {
    "lexiportParseError", "missingStartTag",     "missingEndTag",           "improperlyNestedTag",
    "unknownInlineTag",   "copySourceMalformed", "copyDestinationMalformed"};

std::string payloadDescription(const TagText& text) { return quoted(text); }
std::string payloadDescription(const SourceTag& tag) { return std::string(tag.caseName()); }

}  // namespace

std::string_view SourceTag::caseName() const { return tagNames[payload.index()]; }

bool SourceTag::isInlineTag(Case tag) {
  switch (tag) {
    case Case::inlineFieldStart:
    case Case::inlineFieldEnd:
    case Case::inlineCopySourceStart:
    case Case::inlineCopyDestinationStart:
    case Case::inlineCopySourceEnd:
    case Case::inlineCopyDestinationEnd:
      return true;
    default:
      return false;
  }
}

bool SourceTag::isMultiLineEditableField() const {
  return kind() == Case::multiLineFieldStart || kind() == Case::multiLineFieldEnd;
}

bool SourceTag::isEditableField() const {
  return isMultiLineEditableField() || kind() == Case::inlineFieldStart || kind() == Case::inlineFieldEnd;
}

bool SourceTag::isCopySource() const {
  return kind() == Case::multiLineCopySourceStart || kind() == Case::inlineCopySourceStart ||
         kind() == Case::multiLineCopySourceEnd || kind() == Case::inlineCopySourceEnd;
}

bool SourceTag::isCopyDestination() const {
  return kind() == Case::multiLineCopyDestinationStart || kind() == Case::inlineCopyDestinationStart ||
         kind() == Case::multiLineCopyDestinationEnd || kind() == Case::inlineCopyDestinationEnd;
}

std::string_view SourceTag::ParseError::caseName() const {
  return errorNames[static_cast<std::size_t>(kind)];
}

std::string SourceTag::ParseError::description() const {
  return std::string(caseName()) + "({" + std::to_string(range.location) + ", " +
         std::to_string(range.length) + "}, " +
         std::visit([](const auto& value) { return payloadDescription(value); }, payload) + ")";
}

ErrorPointer SourceTag::ParseError::copy() const { return std::make_shared<ParseError>(*this); }

void SourceTag::ParseError::raise() const { throw *this; }

// The names are literals, so each ends in NUL.
const char* SourceTag::ParseError::what() const noexcept { return caseName().data(); }

bool SourceTag::ParseError::operator==(const ParseError& other) const {
  return kind == other.kind && range == other.range && payload == other.payload;
}

}  // namespace MarletFoundation
