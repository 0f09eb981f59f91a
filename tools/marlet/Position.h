#pragma once

#include <string>
#include <vector>

#include "ExitStatus.h"
#include "Terminal.h"

/// A place in a text as the user names it.
struct AskedPlace {
  enum class Scheme { utf8, utf16, lineAndColumn };
  Scheme scheme;
  /// An offset from 0, or LINE:COLUMN from 1.
  std::string value;
};

/// Whether the value can name a place in its scheme.
bool isWellFormed(const AskedPlace& place);

/// `marlet position`: each place of a file in all schemes, in the order asked. One inside a character is
/// moved behind it.
ExitStatus showPositions(const std::string& path, const std::vector<AskedPlace>& places, bool asJSON,
                         const Terminal& terminal);
