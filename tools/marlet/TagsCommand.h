#pragma once

#include <string>
#include <vector>

#include "ExitStatus.h"
#include "Terminal.h"

/// `marlet tags`: what the tags of each page's source say, and what is wrong with them.
ExitStatus showTags(const std::vector<std::string>& paths, bool asJSON, const Terminal& terminal);
