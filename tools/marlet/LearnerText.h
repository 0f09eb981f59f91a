#pragma once

#include <string>

#include "ExitStatus.h"
#include "Terminal.h"

/// `marlet text`: a file as the learner sees it, byte for byte. The path is relative to "Contents".
ExitStatus printLearnerText(const std::string& book, const std::string& path, const Terminal& terminal);

/// `marlet edits`: what the learner's pack holds, with what can't be read of it.
ExitStatus listEdits(const std::string& book, bool asJSON, const Terminal& terminal);
