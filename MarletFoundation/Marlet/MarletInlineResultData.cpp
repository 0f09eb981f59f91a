#include "MarletFoundation/Marlet/MarletInlineResultData.h"

#include "MarletFoundation/Marlet/LoadChecks.h"
#include "MarletFoundation/Platform/Text.h"
#include "MarletFoundation/Utils/CheckedArithmetic.h"
#include "MarletFoundation/Utils/Overloaded.h"

namespace MarletFoundation {
namespace {

using Result = MarletInlineResultData;
using E = Result::SerializationError;
using Case = Result::SerializationErrorCase;

struct ModeName {
  Result::DisplayMode mode;
  std::string_view stored;
  std::string_view printed;
};
constexpr ModeName modeNames[] = {{Result::DisplayMode::latest, "Latest", "latest"},
                                  {Result::DisplayMode::list, "List", "list"},
                                  {Result::DisplayMode::graph, "Graph", "graph"}};

const ModeName& nameOf(Result::DisplayMode mode) { return modeNames[static_cast<std::size_t>(mode)]; }

Result::DisplayMode mode(const std::string& stored) {
  for (const auto& name : modeNames) {
    if (name.stored == stored) return name.mode;
  }
  throw E(Case::unknownDisplayMode, stored);
}

double number(const PropertyListDictionary& dictionary, std::string_view key, Case missing) {
  const auto* value = dictionary.find(key);
  require<E>(value && value->floatingPoint(), missing);
  return *value->floatingPoint();
}

Result::VisibleSize size(const PropertyListDictionary& dictionary) {
  const auto height = [&] { return number(dictionary, "Height", Case::missingHeightForVisibleState); };
  const auto type = requiredString<E>(dictionary, "Type", Case::missingTypeForVisibleState);
  if (type == "MaxSize") {
    const auto width = number(dictionary, "Width", Case::missingWidthForVisibleState);
    return Result::AtMost{width, height()};
  }
  if (type == "FullWidth") return Result::FullWidth{height()};
  throw E(Case::unknownTypeForVisibleState, type);
}

Result::VisibleState state(const PropertyListValue* value) {
  if (!value || !value->dictionary()) return Result::Hidden{};
  const auto& dictionary = *value->dictionary();
  const auto displayMode =
      mode(requiredString<E>(dictionary, "Mode", Case::missingDisplayModeForVisibleState));
  return Result::Visible{size(dictionary), displayMode};
}

PropertyListDictionary dictionary(const Result::Visible& visible) {
  auto result =
      std::visit(overloaded{[](const Result::AtMost& size) {
                              return PropertyListDictionary{
                                  {"Type", "MaxSize"}, {"Width", size.width}, {"Height", size.height}};
                            },
                            [](const Result::FullWidth& size) {
                              return PropertyListDictionary{{"Type", "FullWidth"}, {"Height", size.height}};
                            }},
                 visible.size);
  result["Mode"] = nameOf(visible.mode).stored;
  return result;
}

}  // namespace

const ErrorTable& errorTable(Case) {
  static constexpr ErrorRow rows[] = {
      {"unknownDisplayMode"},          {"unknownTypeForVisibleState"},        {"rootNotADictionary"},
      {"missingLineNumber"},           {"missingDisplayModeForVisibleState"}, {"missingTypeForVisibleState"},
      {"missingWidthForVisibleState"}, {"missingHeightForVisibleState"},
  };
  static constexpr ErrorTable table{"MarletFoundation.MarletInlineResultData.SerializationError", rows};
  return table;
}

MarletInlineResultData::MarletInlineResultData(const PropertyListValue& value) : visibleState(Hidden{}) {
  require<E>(value.dictionary(), Case::rootNotADictionary);
  const auto* lineValue = value.dictionary()->find("Line");
  require<E>(lineValue && lineValue->integer() && leavesRoomForSums(*lineValue->integer()),
             Case::missingLineNumber);
  line = *lineValue->integer();
  visibleState = state(value.dictionary()->find("VisibleState"));
}

PropertyListValue MarletInlineResultData::propertyListValue() const {
  PropertyListDictionary result{{"Line", line}};
  if (const auto* visible = std::get_if<Visible>(&visibleState))
    result["VisibleState"] = dictionary(*visible);
  return result;
}

std::string description(const MarletInlineResultData& result) {
  const auto printedSize = overloaded{[](const Result::AtMost& size) {
                                        return "atMost(width: " + shortestDecimal(size.width) +
                                               ", height: " + shortestDecimal(size.height) + ")";
                                      },
                                      [](const Result::FullWidth& size) {
                                        return "fullWidth(height: " + shortestDecimal(size.height) + ")";
                                      }};
  const auto printedState = overloaded{[&](const Result::Visible& visible) {
                                         return "visible(size: " + std::visit(printedSize, visible.size) +
                                                ", mode: " + std::string(nameOf(visible.mode).printed) + ")";
                                       },
                                       [](const Result::Hidden&) { return std::string("hidden"); }};
  return "MarletInlineResultData(line: " + std::to_string(result.line) +
         ", characterOffset: " + std::to_string(result.characterOffset) +
         ", visibleState: " + std::visit(printedState, result.visibleState) + ")";
}

std::string description(const InlineResults& results) {
  if (results.empty()) return "[:]";
  std::string text = "[";
  for (const auto& [line, result] : results) {
    if (text.size() > 1) text += ", ";
    text += std::to_string(line) + ": " + description(result);
  }
  return text += "]";
}

}  // namespace MarletFoundation
