#pragma once

#include <functional>
#include <string_view>
#include <vector>

#include "Problem.h"

/// What is wrong with the tags of a page's source, in its order, with line, column and length in the whole
/// text: each mistake as an error of the rule "tag.CASE", and each line that looks like a tag and is none as a
/// warning of the rule "tag.notATag". The description says how to mend it.
std::vector<Problem> tagProblems(std::u16string_view source);

enum class CopySourceLookup { found, noPage, noCopySource };
/// Answers for a page reference and an identifier.
using FindCopySource = std::function<CopySourceLookup(std::string_view page, std::string_view identifier)>;

/// A warning of the rule "tag.unknownPage" or "tag.unknownCopySource" for each copy destination of a source
/// that can't be filled.
std::vector<Problem> copyDestinationProblems(std::u16string_view source, const FindCopySource& find);
