#pragma once

#include <cstdint>
#include <optional>
#include <string>

#include "MarletFoundation/Platform/Error.h"

/// Where in a document an error lies, and under which rule it is filed: both follow the innermost error.
struct ProblemPlace {
  std::string rule;
  std::optional<std::string> file;
  std::optional<std::int64_t> line;
};

/// Of an error that was met while the book was loaded.
ProblemPlace placeInBook(const MarletFoundation::Error& error);
/// Of an error that was met while the page at `directory`, relative to the book, was loaded.
ProblemPlace placeInPage(const std::string& directory, const MarletFoundation::Error& error);
/// Of an error that was met while a classic document was loaded, in `file` where the error doesn't tell.
ProblemPlace placeInMarlet(const MarletFoundation::Error& error, const std::string& file);
