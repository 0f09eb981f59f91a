#pragma once

#include <string>
#include <vector>

#include "ExitStatus.h"
#include "Terminal.h"

/// `marlet edit`: saves files as the learner's edits. `settings` are PATH=FILE, and a reverted path goes back
/// to its authored text; paths are relative to "Contents".
ExitStatus edit(const std::string& book, const std::vector<std::string>& settings,
                const std::vector<std::string>& reverted, bool asJSON, const Terminal& terminal);
