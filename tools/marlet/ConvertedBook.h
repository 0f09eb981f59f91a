#pragma once

#include <string>

#include "MarletFoundation/MarletFoundation.h"

/// The tree of a book with one chapter, and in it one page for each of the classic document's; the icon becomes
/// the book's image. `path` names the document in refusals, `url` is where the book will lie. Throws
/// `CommandFailure` where no book can be made.
MarletFoundation::FileWrapper bookOfMarlet(const MarletFoundation::MarletSnapshot& marlet,
                                           const std::string& path, const MarletFoundation::URL& url);
