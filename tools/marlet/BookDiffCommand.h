#pragma once

#include <optional>
#include <string>

#include "ExitStatus.h"
#include "Terminal.h"

struct BookDiffOptions {
  /// Where to write the pack.
  std::optional<std::string> output;
  bool asJSON = false;
  /// Whether to print the hunks, too.
  bool withHunks = false;
  /// Whether a difference is a no.
  bool exitCode = false;
};

/// `marlet diff` of two books: the update pack that leads from the one to the other.
ExitStatus diffBooks(const std::string& original, const std::string& updated, const BookDiffOptions& options,
                     const Terminal& terminal);
