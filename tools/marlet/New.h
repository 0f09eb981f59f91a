#pragma once

#include <optional>
#include <string>

#include "ExitStatus.h"
#include "Terminal.h"

/// `marlet new`: makes books, chapters and pages. Each is written as a whole or not at all, and nothing that
/// is there is overwritten.

/// A book that opens, with one chapter and one page. Without a name it is called after its directory; without
/// an identifier it gets a random one.
ExitStatus makeBook(const std::string& path, const std::optional<std::string>& name,
                    const std::optional<std::string>& identifier, const Terminal& terminal);
/// A chapter without pages, at the end of the book. Its directory is called as it is.
ExitStatus makeChapter(const std::string& book, const std::string& name, const Terminal& terminal);
/// A page at the end of a chapter. Its directory is called as it is, with the extension of its kind.
ExitStatus makePage(const std::string& book, const std::string& chapter, const std::string& name,
                    bool isCutscene, const Terminal& terminal);
