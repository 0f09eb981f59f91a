#pragma once

#include <string_view>
#include <vector>

#include "MarletDiff/Characters.h"
#include "MarletDiff/Comparison.h"

namespace MarletDiff {

/// A text with its characters.
template <class Unit>
struct Text {
  explicit Text(View<Unit> text) : view(text), characters(text) {}
  View<Unit> view;
  Characters<Unit> characters;
};

/// Moves each insertion and removal along equal text to where it starts and ends best in the original: at a
/// line's start, at the outer edge of a comment, at a word's start, at a word's end. Of equally good places it
/// takes the last. Changes are given by offsets; two may touch afterwards, but only where that is better.
template <class Unit>
void slideChanges(Text<Unit>& original, Text<Unit>& modified, std::pmr::vector<Change>& changes);

}  // namespace MarletDiff
