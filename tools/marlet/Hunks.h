#pragma once

#include <nlohmann/json.hpp>
#include <string_view>

#include "MarletDiff/FileDiffDescriptor.h"
#include "Terminal.h"

/// `{"originalRange": [location, length], "modifiedRange", "originalContent", "modifiedContent"}`, in UTF-16
/// units; and an array of these.
nlohmann::ordered_json json(const MarletDiff::DiffDescriptor& hunk);

template <class Hunks>
nlohmann::ordered_json hunksJSON(const Hunks& hunks) {
  auto array = nlohmann::ordered_json::array();
  for (const auto& hunk : hunks) array.push_back(json(hunk));
  return array;
}

/// "Added", "Removed", "Modified" or "Replaced".
std::string_view kindName(const MarletDiff::FileDiffDescriptor& entry);

/// The hunks of an entry; none for a file that is not modified.
MarletDiff::DiffDescriptors hunksOf(const MarletDiff::FileDiffDescriptor& entry);

/// "1 hunk", "2 hunks".
std::string counted(std::size_t count, const std::string& noun);

/// Prints a hunk to standard output: its place, and both sides line by line.
void printHunk(const MarletDiff::DiffDescriptor& hunk, const Terminal& terminal);
/// Prints the lines of a text, each behind `mark`.
void printMarked(char mark, std::string_view text, Terminal::Style style, const Terminal& terminal);
