#pragma once

#include <nlohmann/json.hpp>
#include <optional>
#include <string>
#include <vector>

#include "Book.h"

/// What an update would do to a book.
struct UpdatePreview {
  struct File {
    std::string file;
    std::string_view kind;
    /// A removed file goes by the document's root, so one below "Contents" stays.
    bool isLeftInPlace;
  };
  struct Conflict {
    /// In the authored text, from 1.
    std::int64_t line;
    std::string base, learner, update;
  };
  struct Edit {
    enum class State { kept, rebased, conflict };
    std::string file;
    State state = State::kept;
    std::optional<Conflict> conflict = {};
  };

  std::vector<File> files;
  std::vector<Edit> edits;
  /// What the outcome showed, beside the conflicts of edits.
  std::vector<MarletFoundation::UpdateConflict> conflicts;

  /// Throws the error of an update whose hunks don't fit the book.
  UpdatePreview(const Book& book, const MarletFoundation::DiffPackSnapshot& update);
  bool hasConflict() const;
  /// Takes over what stands against the outcome; an edit that is concerned is in conflict.
  void take(std::vector<MarletFoundation::UpdateConflict> conflicts);
};

/// What is wrong, with the words of the error behind it.
std::string wordsOf(const MarletFoundation::UpdateConflict& conflict);

std::string_view stateName(UpdatePreview::Edit::State state);

nlohmann::ordered_json json(const UpdatePreview::File& file);
nlohmann::ordered_json json(const UpdatePreview::Edit& edit);
nlohmann::ordered_json json(const MarletFoundation::UpdateConflict& conflict);
