#include "JSON.h"

#include <cmath>
#include <ctime>

#include "MarletFoundation/Utils/Overloaded.h"

using namespace MarletFoundation;
using nlohmann::ordered_json;

namespace {

std::string base64(std::span<const std::uint8_t> bytes) {
  static constexpr char digits[] = "ABCDEFGHIJKLMNOPQRSTUVWXYZabcdefghijklmnopqrstuvwxyz0123456789+/";
  std::string text;
  for (std::size_t i = 0; i < bytes.size(); i += 3) {
    const std::size_t count = std::min<std::size_t>(3, bytes.size() - i);
    std::uint32_t group = 0;
    for (std::size_t k = 0; k < 3; ++k) group = group << 8 | (k < count ? bytes[i + k] : 0u);
    for (std::size_t k = 0; k < 4; ++k) text += k <= count ? digits[group >> (18 - 6 * k) & 63] : '=';
  }
  return text;
}

std::string iso8601(Date date) {
  const double sinceEpoch = date.secondsSinceReferenceDate + Date::unixEpochOffset;
  const double whole = std::floor(sinceEpoch);
  // The years 0000 to 9999.
  if (!(whole >= -62167219200.0 && whole <= 253402300799.0))
    throw NotRepresentable("A date is out of ISO 8601's range.");
  const auto seconds = static_cast<std::time_t>(whole);
  std::tm parts;
  ::gmtime_r(&seconds, &parts);
  char text[80];
  std::snprintf(text, sizeof text, "%04d-%02d-%02dT%02d:%02d:%02d", parts.tm_year + 1900, parts.tm_mon + 1,
                parts.tm_mday, parts.tm_hour, parts.tm_min, parts.tm_sec);
  const auto milliseconds = static_cast<int>((sinceEpoch - whole) * 1000);
  char fraction[16] = "";
  if (milliseconds != 0) std::snprintf(fraction, sizeof fraction, ".%03d", milliseconds);
  return std::string(text) + fraction + "Z";
}

}  // namespace

ordered_json json(const PropertyListValue& value) {
  return std::visit(overloaded{
                        [](const PropertyListValue::Array& array) {
                          auto result = ordered_json::array();
                          for (const auto& element : array) result.push_back(json(element));
                          return result;
                        },
                        [](const PropertyListDictionary& dictionary) {
                          auto result = ordered_json::object();
                          for (const auto& [key, element] : dictionary)
                            result.emplace(std::string(key), json(element));
                          return result;
                        },
                        [](const Data& data) {
                          return ordered_json{{"$data", base64(data.bytes())}};
                        },
                        [](const Date& date) {
                          return ordered_json{{"$date", iso8601(date)}};
                        },
                        [](double number) {
                          if (!std::isfinite(number))
                            throw NotRepresentable("JSON has no form for a number that is not finite.");
                          return ordered_json(number);
                        },
                        [](const auto& scalar) { return ordered_json(scalar); },
                    },
                    value.payload);
}

std::string dumped(const ordered_json& value) {
  return value.dump(2, ' ', false, ordered_json::error_handler_t::replace);
}
