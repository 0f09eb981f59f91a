#pragma once

#include <optional>
#include <string>

#include "ExitStatus.h"
#include "Terminal.h"

struct ApplyOptions {
  /// Whether only to say what would be done.
  bool isDryRun = false;
  /// Whether to go on with a pack that isn't meant for this book.
  bool force = false;
  bool asJSON = false;
  /// The directory to copy the document to first.
  std::optional<std::string> backup;
};

/// `marlet apply`: brings an update into a book under its learner's edits, or changes nothing.
ExitStatus apply(const std::string& book, const std::string& pack, const ApplyOptions& options,
                 const Terminal& terminal);
