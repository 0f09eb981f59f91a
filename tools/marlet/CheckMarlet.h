#pragma once

#include <vector>

#include "Document.h"
#include "Problem.h"

/// Opens a classic document and gives the failure that ends its load, if any.
std::vector<Problem> problemsOfMarlet(const Document& document);
