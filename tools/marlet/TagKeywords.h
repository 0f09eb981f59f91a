#pragma once

#include <string>
#include <string_view>

#include "MarletFoundation/SourceAnnotations/SourceTag.h"

/// `//#-end-hidden-code`: a tag as an author writes it, without its payload.
std::string writtenForm(MarletFoundation::SourceTag::Case tag);

/// The keyword that a misspelt word is most likely meant to be, and how many letters tell them apart.
struct NearestKeyword {
  std::string_view keyword;
  std::size_t distance;
};
NearestKeyword nearestKeyword(std::string_view word);
