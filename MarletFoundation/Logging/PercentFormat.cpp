#include "MarletFoundation/Logging/PercentFormat.h"

#include <algorithm>
#include <charconv>
#include <cmath>
#include <optional>

namespace MarletFoundation {
namespace {

struct Conversion {
  std::string_view flags;
  std::size_t width = 0;
  int precision = 6;
  char letter = 0;
  /// Units of the format that it takes, from the percent sign on.
  std::size_t length = 0;
};

/// Removes a number of up to three digits from the front of `text`; 0 when there is none.
int takeNumber(std::string_view& text) {
  const auto digits = std::min<std::size_t>({text.find_first_not_of("0123456789"), text.size(), 3});
  int number = 0;
  std::from_chars(text.data(), text.data() + digits, number);
  text.remove_prefix(digits);
  return number;
}

/// The conversion at the percent sign with which `text` begins.
std::optional<Conversion> conversionAt(std::string_view text) {
  Conversion conversion;
  auto rest = text.substr(1);
  conversion.flags = rest.substr(0, rest.find_first_not_of("-+ 0"));
  rest.remove_prefix(conversion.flags.size());
  conversion.width = static_cast<std::size_t>(takeNumber(rest));
  if (rest.starts_with('.')) {
    rest.remove_prefix(1);
    conversion.precision = takeNumber(rest);
  }
  if (rest.empty() || std::string_view("fegFEG").find(rest[0]) == std::string_view::npos) return std::nullopt;
  conversion.letter = rest[0];
  conversion.length = text.size() - rest.size() + 1;
  return conversion;
}

std::string formatted(double number, const Conversion& conversion) {
  const auto has = [&](char flag) { return conversion.flags.find(flag) != std::string_view::npos; };
  const bool isCapital = conversion.letter < 'a';
  const auto letter = isCapital ? conversion.letter - 'A' + 'a' : conversion.letter;
  const auto form = letter == 'f'   ? std::chars_format::fixed
                    : letter == 'e' ? std::chars_format::scientific
                                    : std::chars_format::general;
  // The largest double has 309 digits in front of the point, and a precision at most 999 behind it.
  char buffer[1400];
  std::string digits(
      buffer, std::to_chars(buffer, std::end(buffer), std::fabs(number), form, conversion.precision).ptr);
  if (isCapital)
    std::transform(digits.begin(), digits.end(), digits.begin(),
                   [](char c) { return c >= 'a' && c <= 'z' ? static_cast<char>(c - 'a' + 'A') : c; });
  const std::string sign = std::signbit(number) ? "-" : has('+') ? "+" : has(' ') ? " " : "";
  const auto used = sign.size() + digits.size();
  const auto missing = conversion.width > used ? conversion.width - used : 0;
  if (has('-')) return sign + digits + std::string(missing, ' ');
  if (has('0') && std::isfinite(number)) return sign + std::string(missing, '0') + digits;
  return std::string(missing, ' ') + sign + digits;
}

}  // namespace

std::string percentFormatted(std::string_view format, std::span<const double> arguments) {
  std::string result;
  while (true) {
    const auto percent = std::min(format.find('%'), format.size());
    result += format.substr(0, percent);
    format.remove_prefix(percent);
    if (format.empty()) return result;
    if (format.starts_with("%%")) {
      result += '%';
      format.remove_prefix(2);
    } else if (const auto conversion = conversionAt(format); conversion && !arguments.empty()) {
      result += formatted(arguments.front(), *conversion);
      arguments = arguments.subspan(1);
      format.remove_prefix(conversion->length);
    } else {
      result += '%';
      format.remove_prefix(1);
    }
  }
}

}  // namespace MarletFoundation
