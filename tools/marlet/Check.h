#pragma once

#include <string>
#include <vector>

#include "ExitStatus.h"
#include "Terminal.h"

/// `marlet check`: opens each document in full and reports what is wrong with it.
ExitStatus check(const std::vector<std::string>& paths, bool asJSON, const Terminal& terminal);
