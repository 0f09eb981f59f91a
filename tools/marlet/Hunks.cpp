#include "Hunks.h"

#include <iostream>

#include "MarletFoundation/Platform/Text.h"

using namespace MarletFoundation;
using nlohmann::ordered_json;

ordered_json json(const MarletDiff::DiffDescriptor& hunk) {
  const auto& [original, modified, originalContent, modifiedContent] = hunk;
  return {{"originalRange", ordered_json::array({original.location, original.length})},
          {"modifiedRange", ordered_json::array({modified.location, modified.length})},
          {"originalContent", utf8FromUTF16Lossy(originalContent)},
          {"modifiedContent", utf8FromUTF16Lossy(modifiedContent)}};
}

std::string_view kindName(const MarletDiff::FileDiffDescriptor& entry) {
  static constexpr std::string_view names[] = {"Added", "Removed", "Modified", "Replaced"};
  return names[entry.change.index()];
}

MarletDiff::DiffDescriptors hunksOf(const MarletDiff::FileDiffDescriptor& entry) {
  const auto* modified = std::get_if<MarletDiff::FileDiffDescriptor::Modified>(&entry.change);
  return modified ? modified->diff : MarletDiff::DiffDescriptors();
}

std::string counted(std::size_t count, const std::string& noun) {
  return std::to_string(count) + " " + noun + (count == 1 ? "" : "s");
}

void printMarked(char mark, std::string_view text, Terminal::Style style, const Terminal& terminal) {
  if (text.empty()) return;
  if (text.ends_with('\n')) text.remove_suffix(1);
  for (const auto line : split(text, '\n')) {
    std::cout << terminal.styled(style, mark + printable(line)) << "\n";
  }
}

void printHunk(const MarletDiff::DiffDescriptor& hunk, const Terminal& terminal) {
  const auto place = [](const TextRange& range) {
    return std::to_string(range.location) + "," + std::to_string(range.length);
  };
  std::cout << terminal.styled(Terminal::Style::dim,
                               "@@ -" + place(hunk.originalRange) + " +" + place(hunk.modifiedRange) + " @@")
            << "\n";
  printMarked('-', utf8FromUTF16Lossy(hunk.originalContent), Terminal::Style::red, terminal);
  printMarked('+', utf8FromUTF16Lossy(hunk.modifiedContent), Terminal::Style::green, terminal);
}
