#include "MarletFoundation/Marlet/LegacyTimelineXMLParser.h"

#include <algorithm>
#include <charconv>

#include "MarletFoundation/Platform/RegularExpression.h"
#include "MarletFoundation/Platform/Text.h"

namespace MarletFoundation {
namespace {

constexpr std::string_view itemElement = "LoggerValueHistoryTimelineItem";

struct Expressions {
  RegularExpression startingLineNumber{u"StartingLineNumber=([0-9]+)"};
  RegularExpression characterLocation{u"CharacterRangeLoc=([0-9]+)"};
  // Looking back changes no match, but spares a long run of digits from being tried from each of them.
  RegularExpression lockedSize{u"(?<![0-9])([0-9]+), *([0-9]+)"};
};

const Expressions& expressions() {
  static const Expressions constants;
  return constants;
}

/// The capture groups of the first match, as UTF-8; none without a match.
std::vector<std::string> captures(const RegularExpression& expression, const std::string& value) {
  std::vector<std::string> groups;
  const auto text = utf16FromUTF8(value);
  const auto match = text ? expression.firstMatch(*text) : std::nullopt;
  if (!match) return groups;
  for (auto group = match->begin() + 1; group != match->end(); ++group) {
    groups.push_back(utf8FromUTF16Lossy(std::u16string_view(*text).substr(
        static_cast<std::size_t>(group->location), static_cast<std::size_t>(group->length))));
  }
  return groups;
}

std::optional<std::int64_t> capturedInteger(const RegularExpression& expression, const std::string& value) {
  const auto groups = captures(expression, value);
  return groups.empty() ? std::nullopt : parseDecimalInteger(groups[0]);
}

/// Of digits only; nothing for more of them than a double can take.
std::optional<double> parseDigits(const std::string& digits) {
  double number = 0;
  const auto result = std::from_chars(digits.data(), digits.data() + digits.size(), number);
  return result.ec == std::errc() ? std::optional(number) : std::nullopt;
}

std::optional<LegacyTimelineXMLParser::DocumentLocation> documentLocation(const std::string& value) {
  const auto line = capturedInteger(expressions().startingLineNumber, value);
  const auto character = capturedInteger(expressions().characterLocation, value);
  if (!line || !character) return std::nullopt;
  return LegacyTimelineXMLParser::DocumentLocation{*line, *character};
}

std::optional<LegacyTimelineXMLParser::LockedSize> lockedSize(const std::string& value) {
  const auto groups = captures(expressions().lockedSize, value);
  if (groups.size() != 2) return std::nullopt;
  const auto width = parseDigits(groups[0]), height = parseDigits(groups[1]);
  if (!width || !height) return std::nullopt;
  return LegacyTimelineXMLParser::LockedSize{*width, *height};
}

bool isYes(std::string value) {
  std::transform(value.begin(), value.end(), value.begin(),
                 [](char c) { return c >= 'A' && c <= 'Z' ? static_cast<char>(c + 32) : c; });
  return value == "yes";
}

}  // namespace

LegacyTimelineXMLParser::LegacyTimelineXMLParser(Data data) : parser_(std::move(data)) {
  parser_.delegate = this;
}

std::vector<LegacyTimelineXMLParser::DataItem> LegacyTimelineXMLParser::parsedResults() {
  parser_.parse();
  return collectedValues_;
}

void LegacyTimelineXMLParser::didStartElement(XMLParser&, const std::string& name,
                                              const XMLParser::Attributes& attributes) {
  if (name != itemElement) return;
  const auto read = [&](std::string_view attribute, const auto& use) {
    if (const auto found = attributes.find(attribute); found != attributes.end()) use(found->second);
  };
  auto& item = currentItem_;
  read("documentLocation", [&](const auto& value) { item.documentLocation = documentLocation(value); });
  read("lockedSize", [&](const auto& value) { item.lockedSize = lockedSize(value); });
  read("selectedRepresentationIndex",
       [&](const auto& value) { item.selectedRepresentationIndex = parseDecimalInteger(value).value_or(0); });
  read("shouldTrackSuperviewWidth",
       [&](const auto& value) { item.shouldTrackSuperviewWidth = isYes(value); });
}

void LegacyTimelineXMLParser::didEndElement(XMLParser&, const std::string& name) {
  if (name != itemElement) return;
  collectedValues_.push_back(currentItem_);
  currentItem_ = {};
}

}  // namespace MarletFoundation
