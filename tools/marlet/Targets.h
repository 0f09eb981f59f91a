#pragma once

#include "ExitStatus.h"
#include "Terminal.h"

/// `marlet targets`: the platforms that the library knows, in the order in which it found them.
ExitStatus listTargets(bool asJSON, const Terminal& terminal);
