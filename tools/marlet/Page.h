#pragma once

#include <string>

#include "ExitStatus.h"
#include "Terminal.h"

enum class PageOutput { summary, text, json };

/// `marlet page`: what a learner has before them on one page.
ExitStatus showPage(const std::string& book, const std::string& chapter, const std::string& page,
                    PageOutput output, const Terminal& terminal);
