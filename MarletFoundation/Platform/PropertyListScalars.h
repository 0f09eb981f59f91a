#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>

#include "MarletFoundation/Platform/Date.h"

/// The XML forms of numbers, dates and data. None depends on the locale; white space around them is the
/// caller's.
namespace MarletFoundation::PropertyListScalars {

/// An integer's reading: malformed, well-formed but too large, or a number.
struct IntegerText {
  bool wellFormed = false;
  std::optional<std::int64_t> number;
};

/// `[+-]` digits, or `[+-]` `0x` and hexadecimal digits.
IntegerText parseInteger(std::string_view text);
/// A decimal number with optional fraction and exponent, or `inf`, `infinity`, `nan` in any case, with an
/// optional sign. What is too small for a double is 0, what is too large is nothing.
std::optional<double> parseReal(std::string_view text);
/// `YYYY-MM-DDThh:mm:ssZ`, a moment that exists.
std::optional<Date> parseDate(std::string_view text);
/// Appends the bytes that padded base64 text stands for, white space ignored anywhere; false if it is
/// malformed.
bool appendFromBase64(std::string& bytes, std::string_view text);

void appendInteger(std::string& text, std::int64_t number);
/// The shortest form that reads as the same number; `inf`, `-inf` and `nan` by these names.
void appendReal(std::string& text, double number);
/// The date's whole second, rounded down; false, and nothing appended, outside the years 0 to 9999.
bool appendDate(std::string& text, Date date);
void appendBase64(std::string& text, std::string_view bytes);

}  // namespace MarletFoundation::PropertyListScalars
