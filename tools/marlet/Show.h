#pragma once

#include <string>

#include "ExitStatus.h"
#include "Terminal.h"

/// `marlet show`: a document's table of contents.
ExitStatus show(const std::string& path, bool asJSON, const Terminal& terminal);
