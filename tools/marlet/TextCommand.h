#pragma once

#include <optional>
#include <string>

#include "BookDiffCommand.h"

/// `marlet diff`: of two text files, their hunks; of anything else, `diffBooks`.
ExitStatus diff(const std::string& original, const std::string& updated, const BookDiffOptions& options,
                const Terminal& terminal);

/// `marlet merge`: three text files merged into one, on standard output unless a file is named for it.
ExitStatus merge(const std::string& base, const std::string& ours, const std::string& theirs,
                 const std::optional<std::string>& output, const Terminal& terminal);
