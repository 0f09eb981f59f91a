#pragma once

#include "Document.h"
#include "Terminal.h"

/// Prints a classic document's pages and what it shares among them. Throws what its load throws.
void showMarlet(const Document& document, bool asJSON, const Terminal& terminal);
