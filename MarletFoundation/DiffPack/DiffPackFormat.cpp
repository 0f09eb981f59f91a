#include "MarletFoundation/DiffPack/DiffPackFormat.h"

#include <algorithm>
#include <charconv>

namespace MarletFoundation::DiffPackFormat {
namespace {

/// Takes the next run of digits off the text.
std::int64_t takeNumber(std::string_view& text) {
  text.remove_prefix(std::min(text.find_first_of("0123456789"), text.size()));
  std::int64_t number = 0;
  const auto [end, error] = std::from_chars(text.data(), text.data() + text.size(), number);
  text.remove_prefix(static_cast<std::size_t>(end - text.data()));
  return error == std::errc::result_out_of_range ? std::numeric_limits<std::int64_t>::max() : number;
}

}  // namespace

std::string rangeString(const TextRange& range) {
  return "{" + std::to_string(range.location) + ", " + std::to_string(range.length) + "}";
}

TextRange rangeFromString(std::string_view text) {
  const auto location = takeNumber(text);
  return {location, std::min(takeNumber(text), std::numeric_limits<std::int64_t>::max() - location)};
}

}  // namespace MarletFoundation::DiffPackFormat
