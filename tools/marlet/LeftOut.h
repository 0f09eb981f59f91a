#pragma once

#include <string>
#include <vector>

#include "Document.h"
#include "MarletFoundation/MarletFoundation.h"

/// What lies in a classic document without being part of it, and so isn't carried over when it is converted: files that
/// nobody reads, pages that its list doesn't name, directories that its version has none of. Paths within the document.
std::vector<std::string> leftOut(const Document& document, const MarletFoundation::MarletSnapshot& marlet);
