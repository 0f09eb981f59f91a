#pragma once

#include <optional>
#include <string>
#include <vector>

#include "MarletFoundation/Marlet/PageType.h"
#include "Problem.h"

/// A reference in the manifest of `directory` that names no file in that directory's resources. URLs with a
/// scheme are not looked for. `kind` is the rule's first word.
std::vector<Problem> warningsOfReference(const MarletFoundation::FileWrapper& book,
                                         const std::string& directory, const std::string& kind,
                                         const std::string& key, const std::optional<std::string>& reference);

/// What the page at `directory`, a path below the book, was loaded in spite of.
std::vector<Problem> warningsOfPage(const MarletFoundation::FileWrapper& book, const std::string& directory,
                                    const MarletFoundation::BookPageSnapshotType& page);
