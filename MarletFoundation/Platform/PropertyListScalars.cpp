#include "MarletFoundation/Platform/PropertyListScalars.h"

#include <array>
#include <charconv>
#include <chrono>
#include <cmath>
#include <limits>

namespace MarletFoundation::PropertyListScalars {
namespace {

constexpr std::string_view base64Digits = "ABCDEFGHIJKLMNOPQRSTUVWXYZabcdefghijklmnopqrstuvwxyz0123456789+/";
constexpr std::uint8_t notADigit = 0xFF;
constexpr std::uint8_t blank = 0xFE;

constexpr auto base64Values = [] {
  std::array<std::uint8_t, 256> values{};
  values.fill(notADigit);
  for (std::size_t i = 0; i < base64Digits.size(); ++i)
    values[static_cast<std::uint8_t>(base64Digits[i])] = static_cast<std::uint8_t>(i);
  for (const char c : {' ', '\t', '\n', '\r'}) values[static_cast<std::uint8_t>(c)] = blank;
  return values;
}();

bool isDigit(char c) { return c >= '0' && c <= '9'; }

bool equalsIgnoringCase(std::string_view text, std::string_view lower) {
  if (text.size() != lower.size()) return false;
  for (std::size_t i = 0; i < text.size(); ++i) {
    if ((text[i] | 0x20) != lower[i]) return false;
  }
  return true;
}

// Whether a decimal number that no double can hold is too large, and not too small, for one: by the place of
// its first digit that isn't 0.
bool isHuge(std::string_view text) {
  const auto mantissa = text.substr(0, text.find_first_of("eE"));
  const auto point = std::min(mantissa.find('.'), mantissa.size());
  const auto leading = mantissa.find_first_of("123456789");
  const bool negativeExponent = mantissa.size() + 1 < text.size() && text[mantissa.size() + 1] == '-';
  std::int64_t exponent = 0;
  if (mantissa.size() < text.size()) {
    const auto digits =
        text.substr(mantissa.size() + 1 + (negativeExponent || text[mantissa.size() + 1] == '+'));
    if (std::from_chars(digits.data(), digits.data() + digits.size(), exponent).ec != std::errc())
      exponent = std::numeric_limits<std::int64_t>::max() / 2;
    if (negativeExponent) exponent = -exponent;
  }
  return static_cast<std::int64_t>(point) - static_cast<std::int64_t>(leading) + exponent > 0;
}

}  // namespace

IntegerText parseInteger(std::string_view text) {
  const bool negative = text.starts_with('-');
  if (negative || text.starts_with('+')) text.remove_prefix(1);
  const bool hexadecimal = text.starts_with("0x") || text.starts_with("0X");
  if (hexadecimal) text.remove_prefix(2);
  std::uint64_t magnitude = 0;
  const auto* const end = text.data() + text.size();
  const auto [stop, error] = std::from_chars(text.data(), end, magnitude, hexadecimal ? 16 : 10);
  if (error == std::errc::invalid_argument || stop != end) return {};
  const auto largest = static_cast<std::uint64_t>(std::numeric_limits<std::int64_t>::max()) + negative;
  if (error != std::errc() || magnitude > largest) return {true, std::nullopt};
  return {true, static_cast<std::int64_t>(negative ? 0 - magnitude : magnitude)};
}

std::optional<double> parseReal(std::string_view text) {
  const bool negative = text.starts_with('-');
  if (negative || text.starts_with('+')) text.remove_prefix(1);
  if (text.empty()) return std::nullopt;
  double number = 0;
  if (isDigit(text[0]) || text[0] == '.') {
    const auto* const end = text.data() + text.size();
    const auto [stop, error] = std::from_chars(text.data(), end, number);
    if (error == std::errc::invalid_argument || stop != end) return std::nullopt;
    if (error == std::errc::result_out_of_range) {
      if (isHuge(text)) return std::nullopt;
      number = 0;
    }
  } else if (equalsIgnoringCase(text, "inf") || equalsIgnoringCase(text, "infinity")) {
    number = std::numeric_limits<double>::infinity();
  } else if (equalsIgnoringCase(text, "nan")) {
    number = std::numeric_limits<double>::quiet_NaN();
  } else {
    return std::nullopt;
  }
  return negative ? -number : number;
}

std::optional<Date> parseDate(std::string_view text) {
  constexpr std::string_view form = "0000-00-00T00:00:00Z";
  if (text.size() != form.size()) return std::nullopt;
  for (std::size_t i = 0; i < form.size(); ++i) {
    if (form[i] == '0' ? !isDigit(text[i]) : text[i] != form[i]) return std::nullopt;
  }
  const auto number = [text](std::size_t place, std::size_t count) {
    int value = 0;
    for (const char digit : text.substr(place, count)) value = value * 10 + (digit - '0');
    return value;
  };
  const std::chrono::year_month_day day{std::chrono::year(number(0, 4)),
                                        std::chrono::month(static_cast<unsigned>(number(5, 2))),
                                        std::chrono::day(static_cast<unsigned>(number(8, 2)))};
  const int hour = number(11, 2);
  const int minute = number(14, 2);
  const int second = number(17, 2);
  if (!day.ok() || hour > 23 || minute > 59 || second > 59) return std::nullopt;
  const auto days = std::chrono::sys_days(day).time_since_epoch().count();
  const auto seconds = std::int64_t{days} * 86400 + hour * 3600 + minute * 60 + second;
  return Date{static_cast<double>(seconds) - Date::unixEpochOffset};
}

bool appendFromBase64(std::string& bytes, std::string_view text) {
  std::uint32_t group = 0;
  int digits = 0;
  std::size_t place = 0;
  bytes.reserve(bytes.size() + text.size() / 4 * 3);
  for (; place < text.size(); ++place) {
    const auto value = base64Values[static_cast<std::uint8_t>(text[place])];
    if (value == blank) continue;
    if (value == notADigit) break;
    group = group << 6 | value;
    if (++digits < 4) continue;
    const char triple[] = {static_cast<char>(group >> 16), static_cast<char>(group >> 8),
                           static_cast<char>(group)};
    bytes.append(triple, 3);
    group = 0;
    digits = 0;
  }
  int padding = 0;
  for (; place < text.size(); ++place) {
    if (text[place] == '=') {
      ++padding;
    } else if (base64Values[static_cast<std::uint8_t>(text[place])] != blank) {
      return false;
    }
  }
  if (digits == 0) return padding == 0;
  if (digits == 1 || padding != 4 - digits) return false;
  group <<= 6 * padding;
  bytes.push_back(static_cast<char>(group >> 16));
  if (digits == 3) bytes.push_back(static_cast<char>(group >> 8));
  return true;
}

void appendInteger(std::string& text, std::int64_t number) {
  char buffer[24];
  text.append(buffer, std::to_chars(buffer, std::end(buffer), number).ptr);
}

void appendReal(std::string& text, double number) {
  if (std::isnan(number)) {
    text += "nan";
    return;
  }
  char buffer[32];
  text.append(buffer, std::to_chars(buffer, std::end(buffer), number).ptr);
}

bool appendDate(std::string& text, Date date) {
  const auto second = std::floor(date.secondsSinceReferenceDate) + Date::unixEpochOffset;
  constexpr double firstSecond = -62167219200;  // 0000-01-01T00:00:00Z
  constexpr double endSecond = 253402300800;    // 10000-01-01T00:00:00Z
  if (!(second >= firstSecond && second < endSecond)) return false;
  const std::chrono::sys_seconds moment{std::chrono::seconds(static_cast<std::int64_t>(second))};
  const auto midnight = std::chrono::floor<std::chrono::days>(moment);
  const std::chrono::year_month_day day(midnight);
  const std::chrono::hh_mm_ss time(moment - midnight);
  char form[] = "0000-00-00T00:00:00Z";
  const auto put = [&form](std::size_t lastDigit, std::int64_t value) {
    for (; value > 0; value /= 10) form[lastDigit--] = static_cast<char>('0' + value % 10);
  };
  put(3, int{day.year()});
  put(6, unsigned{day.month()});
  put(9, unsigned{day.day()});
  put(12, time.hours().count());
  put(15, time.minutes().count());
  put(18, time.seconds().count());
  text += form;
  return true;
}

void appendBase64(std::string& text, std::string_view bytes) {
  const auto byteAt = [bytes](std::size_t i) -> std::uint32_t {
    return i < bytes.size() ? static_cast<std::uint8_t>(bytes[i]) : 0U;
  };
  text.reserve(text.size() + (bytes.size() + 2) / 3 * 4);
  for (std::size_t i = 0; i < bytes.size(); i += 3) {
    const auto group = byteAt(i) << 16 | byteAt(i + 1) << 8 | byteAt(i + 2);
    char digits[] = {base64Digits[group >> 18], base64Digits[group >> 12 & 63], base64Digits[group >> 6 & 63],
                     base64Digits[group & 63]};
    if (i + 1 >= bytes.size()) digits[2] = '=';
    if (i + 2 >= bytes.size()) digits[3] = '=';
    text.append(digits, 4);
  }
}

}  // namespace MarletFoundation::PropertyListScalars
