#include "MarletFoundation/Marlet/LegacyTimelineFormat.h"

#include <cmath>
#include <limits>

#include "MarletFoundation/Marlet/LegacyTimelineXMLParser.h"
#include "MarletFoundation/Platform/Date.h"
#include "MarletFoundation/Platform/Text.h"
#include "MarletFoundation/Utils/CheckedArithmetic.h"
#include "MarletFoundation/Utils/Overloaded.h"

namespace MarletFoundation {
namespace {

using Result = MarletInlineResultData;
using Mode = Result::DisplayMode;

/// What the older editor wrote as the width of a result that fills it.
constexpr double fullWidth = 1024;

/// Not the order of the modes.
std::string_view representationIndex(Mode mode) {
  switch (mode) {
    case Mode::latest:
      return "0";
    case Mode::graph:
      return "1";
    case Mode::list:
      return "2";
  }
  return "0";
}

Mode mode(std::int64_t representationIndex) {
  if (representationIndex == 1) return Mode::graph;
  return representationIndex == 2 ? Mode::list : Mode::latest;
}

/// Without its fraction; the nearest integer that there is for a number too large, 0 for what is no number.
std::string wholeNumber(double number) {
  using Limits = std::numeric_limits<std::int64_t>;
  if (std::isnan(number)) return "0";
  if (number >= 0x1p63) return std::to_string(Limits::max());
  if (number < -0x1p63) return std::to_string(Limits::min());
  return std::to_string(static_cast<std::int64_t>(number));
}

std::string sizeAttributes(double width, double height, bool tracksWidth) {
  return R"(lockedSize = "{)" + wholeNumber(width) + ", " + wholeNumber(height) +
         R"(}" shouldTrackSuperviewWidth = ")" + (tracksWidth ? "YES" : "NO") + '"';
}

std::string stateAttributes(const Result::Visible& visible) {
  const auto size = std::visit(
      overloaded{[](const Result::AtMost& s) { return sizeAttributes(s.width, s.height, false); },
                 [](const Result::FullWidth& s) { return sizeAttributes(fullWidth, s.height, true); }},
      visible.size);
  return size + R"( selectedRepresentationIndex = ")" + std::string(representationIndex(visible.mode)) + '"';
}

std::string stateAttributes(const Result::Hidden&) {
  return R"(shouldTrackSuperviewWidth = "NO" selectedRepresentationIndex = "0")";
}

Result::VisibleState visibleState(const LegacyTimelineXMLParser::DataItem& item) {
  if (!item.lockedSize) return Result::Hidden{};
  const auto& [width, height] = *item.lockedSize;
  const auto size = item.shouldTrackSuperviewWidth ? Result::VisibleSize(Result::FullWidth{height})
                                                   : Result::AtMost{width, height};
  return Result::Visible{size, mode(item.selectedRepresentationIndex)};
}

}  // namespace

std::string MarletInlineResultData::legacyTimelineItemString() const {
  const auto lineText = std::to_string(line);
  return R"(<LoggerValueHistoryTimelineItem documentLocation = "#CharacterRangeLoc=)" +
         std::to_string(characterOffset) + "&amp;EndingLineNumber=" + lineText +
         "&amp;StartingLineNumber=" + lineText +
         "&amp;Timestamp=" + shortestDecimal(Date::now().secondsSinceReferenceDate) + "\" " +
         std::visit([](const auto& state) { return stateAttributes(state); }, visibleState) +
         "></LoggerValueHistoryTimelineItem>";
}

std::string legacyTimeline(const InlineResults& results) {
  std::string text = R"(<?xml version="1.0" encoding="UTF-8"?><Timeline version = "3.0"><TimelineItems>)";
  text += '\n';
  std::string_view separator;
  for (const auto& [line, result] : results) {
    text += separator;
    text += result.legacyTimelineItemString();
    separator = "\n";
  }
  return text += "</TimelineItems></Timeline>\n";
}

InlineResults inlineResultsFromLegacyTimeline(const Data& data) {
  InlineResults results;
  for (const auto& item : LegacyTimelineXMLParser(data).parsedResults()) {
    if (!item.documentLocation) continue;
    const auto& [line, characterLocation] = *item.documentLocation;
    if (!leavesRoomForSums(line) || !leavesRoomForSums(characterLocation)) continue;
    results.insert_or_assign(line, Result(line, characterLocation, visibleState(item)));
  }
  return results;
}

}  // namespace MarletFoundation
