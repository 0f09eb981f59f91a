#pragma once

#include <string>

#include "ExitStatus.h"
#include "Terminal.h"

/// `marlet convert`: writes a classic document of any version in the form that its shape decides, or, for an
/// output whose name ends in ".marletbook", makes a book of it. All or nothing is written, and nothing that is
/// there is replaced without `force`.
ExitStatus convert(const std::string& path, const std::string& output, bool force, const Terminal& terminal);
