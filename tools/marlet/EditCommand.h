#pragma once

#include <string>
#include <vector>

#include "ExitStatus.h"
#include "Terminal.h"

struct EditOptions {
  /// PATH=FILE, with paths relative to "Contents".
  std::vector<std::string> settings;
  /// Paths that go back to their authored text.
  std::vector<std::string> reverted;
  /// Whether only to rename a pack that can't be read, so that the book opens.
  bool setAside = false;
  bool asJSON = false;
};

/// `marlet edit`: saves files as the learner's edits. A pack with entries that can't be read is written once each of
/// them is reverted or set anew.
ExitStatus edit(const std::string& book, const EditOptions& options, const Terminal& terminal);
