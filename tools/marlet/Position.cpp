#include "Position.h"

#include <iostream>

#include "Guarded.h"
#include "JSON.h"
#include "MarletFoundation/MarletFoundation.h"
#include "MarletFoundation/Platform/Text.h"

using namespace MarletFoundation;
using nlohmann::ordered_json;

namespace {

std::optional<std::int64_t> number(std::string_view text, std::int64_t least) {
  const auto value = parseDecimalInteger(text);
  return value && *value >= least ? value : std::nullopt;
}

std::optional<SourceEditorPosition> lineAndColumn(std::string_view text) {
  const auto parts = split(text, ':');
  if (parts.size() != 2) return std::nullopt;
  const auto line = number(parts[0], 1), column = number(parts[1], 1);
  if (!line || !column) return std::nullopt;
  return SourceEditorPosition(*line - 1, *column - 1);
}

/// The UTF-8 offset of a well-formed place, or nothing for one outside of the text.
std::optional<std::int64_t> utf8Index(const AskedPlace& place, const LineIndexedBuffer& text,
                                      SourceEditorUTF8RangeConverter& converter, std::int64_t utf8Length) {
  if (place.scheme == AskedPlace::Scheme::lineAndColumn) {
    const auto position = *lineAndColumn(place.value);
    if (text.positionFromIndex(text.indexFromPosition(position), position.line) != position)
      return std::nullopt;
    return converter.indexFromSourceEditorPosition(position);
  }
  const auto offset = *number(place.value, 0);
  if (place.scheme == AskedPlace::Scheme::utf8)
    return offset <= utf8Length ? std::optional(offset) : std::nullopt;
  if (offset > converter.endIndex()) return std::nullopt;
  return converter.indexFromSourceEditorPosition(text.positionFromIndex(offset, 0));
}

}  // namespace

bool isWellFormed(const AskedPlace& place) {
  return place.scheme == AskedPlace::Scheme::lineAndColumn ? lineAndColumn(place.value).has_value()
                                                           : number(place.value, 0).has_value();
}

ExitStatus showPositions(const std::string& path, const std::vector<AskedPlace>& places, bool asJSON,
                         const Terminal& terminal) {
  return guarded(path, terminal, [&] {
    const auto data =
        orFailWith(ExitStatus::unreadablePath, path, [&] { return FileManager::readFile(URL::file(path)); });
    auto source = utf16FromUTF8(data.view());
    if (!source) throw CommandFailure{ExitStatus::negative, path + ": The file is not valid UTF-8."};
    const auto text = std::make_shared<const LineIndexedBuffer>(*std::move(source));
    SourceEditorUTF8RangeConverter converter(text);
    auto list = ordered_json::array();
    for (const auto& place : places) {
      const auto asked = utf8Index(place, *text, converter, static_cast<std::int64_t>(data.view().size()));
      if (!asked)
        throw CommandFailure{ExitStatus::negative, path + ": There is no place " + place.value + "."};
      const auto position = converter.sourceEditorPositionFromIndex(*asked);
      const auto [utf8, utf16] = converter.lastConversion();
      list.push_back(
          {{"utf8", utf8}, {"utf16", utf16}, {"line", position.line + 1}, {"column", position.col + 1}});
    }
    if (asJSON) {
      std::cout << dumped(list) << "\n";
      return ExitStatus::good;
    }
    for (const auto& place : list)
      std::cout << "line " << place["line"] << ", column " << place["column"] << ", UTF-8 " << place["utf8"]
                << ", UTF-16 " << place["utf16"] << "\n";
    return ExitStatus::good;
  });
}
