#pragma once

#include <nlohmann/json.hpp>
#include <optional>
#include <string>

#include "MarletFoundation/Platform/Error.h"

/// One finding about a document. Absent fields are unknown.
struct Problem {
  std::string severity = "error";
  /// A permanent name, such as "book.missingVersion".
  std::string rule;
  std::optional<std::string> domain;
  std::optional<int> code;
  std::optional<std::string> caseName;
  std::string description;
  std::optional<std::string> recoverySuggestion;
  /// Relative to the document.
  std::optional<std::string> file;
  /// From 1; columns in UTF-16 units.
  std::optional<std::int64_t> line;
  std::optional<std::int64_t> column;
  std::optional<std::int64_t> length;
};

/// The finding that the failure of a book's load amounts to.
Problem problemOfBookLoad(const MarletFoundation::Error& error);
/// The finding that the failure of a page's load amounts to; `directory` is the page's, relative to the book.
Problem problemOfPageLoad(const MarletFoundation::Error& error, const std::string& directory);
/// The finding that the failure of a classic document's load amounts to, in `file` where the error doesn't tell.
Problem problemOfMarletLoad(const MarletFoundation::Error& error, const std::string& file);
/// What a load lets pass.
Problem warning(std::string rule, std::string description, std::string file);
/// A path at which there is nothing to look at.
Problem problemOfUnreadablePath(const MarletFoundation::Error& error);
/// A fatal condition that the document ran into.
Problem problemOfFatalError(std::string_view message);

nlohmann::ordered_json json(const Problem& problem);
