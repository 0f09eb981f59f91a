#pragma once

#include <vector>

#include "Document.h"
#include "Problem.h"

/// Opens a book and each of its pages as the learner sees it, and gives what is wrong: the failure that ends
/// the book's load, or the failures of its pages; with them, as warnings, what a load lets pass and an author
/// didn't mean.
std::vector<Problem> problemsOfBook(const Document& document);
