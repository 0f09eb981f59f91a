#include "JSON.h"

#include <algorithm>
#include <cmath>
#include <ctime>

#include "MarletFoundation/Utils/Overloaded.h"
#include "SafeText.h"

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

ordered_json jsonOfScalar(const Data& data) { return {{"$data", base64(data.bytes())}}; }

ordered_json jsonOfScalar(const Date& date) { return {{"$date", iso8601(date)}}; }

ordered_json jsonOfScalar(double number) {
  if (!std::isfinite(number)) throw NotRepresentable("JSON has no form for a number that is not finite.");
  return number;
}

template <class Scalar>
ordered_json jsonOfScalar(const Scalar& scalar) {
  return scalar;
}

using Members = std::vector<ordered_json::object_t::value_type>;

/// A value whose JSON is still to be put in its place.
struct Pending {
  const PropertyListValue* source;
  ordered_json* target;
};

/// An array or object that is being written, and what of it comes next.
struct Open {
  const ordered_json* container;
  ordered_json::const_iterator next;
};

/// Levels from which on lines move no further to the right, so that deep values stay linear in length.
constexpr std::size_t deepestIndentation = 512;

}  // namespace

ordered_json json(const PropertyListValue& value) {
  ordered_json root;
  // Not by recursion: a list may be deeper than the stack.
  std::vector<Pending> pending{{&value, &root}};
  while (!pending.empty()) {
    const auto [source, target] = pending.back();
    pending.pop_back();
    std::visit(overloaded{
                   [&](const PropertyListValue::Array& array) {
                     *target = ordered_json::array();
                     auto& elements = target->get_ref<ordered_json::array_t&>();
                     elements.resize(array.size());
                     for (std::size_t i = 0; i < elements.size(); ++i)
                       pending.push_back({&array[i], &elements[i]});
                   },
                   [&](const PropertyListDictionary& dictionary) {
                     *target = ordered_json::object();
                     // Its keys are different from each other; an object would look for each among all.
                     Members& members = target->get_ref<ordered_json::object_t&>();
                     members.reserve(dictionary.size());
                     for (const auto& [key, element] : dictionary) {
                       members.emplace_back(std::string(key), nullptr);
                       pending.push_back({&element, &members.back().second});
                     }
                   },
                   [&](const auto& scalar) { *target = jsonOfScalar(scalar); },
               },
               source->payload);
  }
  return root;
}

std::string dumped(const ordered_json& value) {
  std::string text;
  std::vector<Open> open;
  const auto startLine = [&] {
    text += '\n';
    text.append(2 * std::min(open.size(), deepestIndentation), ' ');
  };
  const auto put = [&](const ordered_json& item) {
    if (item.is_structured() && !item.empty()) {
      text += item.is_array() ? '[' : '{';
      open.push_back({&item, item.begin()});
    } else {
      text += item.dump(-1, ' ', false, ordered_json::error_handler_t::replace);
    }
  };
  put(value);
  while (!open.empty()) {
    auto& [container, next] = open.back();
    if (next == container->end()) {
      const char end = container->is_array() ? ']' : '}';
      open.pop_back();
      startLine();
      text += end;
      continue;
    }
    if (next != container->begin()) text += ',';
    startLine();
    if (container->is_object())
      text += ordered_json(next.key()).dump(-1, ' ', false, ordered_json::error_handler_t::replace) + ": ";
    put(*next++);
  }
  return printableJSON(text);
}
