#pragma once

#include "MarletFoundation/MarletFoundation.h"
#include "Terminal.h"

/// Prints a classic document's pages and what it shares among them.
void showMarlet(const MarletFoundation::MarletSnapshot& marlet, bool asJSON, const Terminal& terminal);
