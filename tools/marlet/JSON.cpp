#include "JSON.h"

#include <algorithm>
#include <cmath>
#include <ctime>

#include "MarletFoundation/Data/PropertyListChildren.h"
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

// Deeper lines are indented no further, so that the output grows with the value alone.
constexpr std::size_t deepestIndentation = 512;

/// Writes a property list as it goes, in the form of `dumped`: a tree of the library's would be filled in quadratic
/// time, and printed and destroyed by the stack or by memory that may not be there.
class Writer {
 public:
  /// The value stands on a line of that depth.
  explicit Writer(std::size_t depth) : depth_(depth) {}

  std::string write(const PropertyListValue& value) {
    writeValue(value);
    while (!open_.empty()) writeNextChild();
    return std::move(text_);
  }

 private:
  struct OpenContainer {
    PropertyListChildren children;
    bool isFirst = true;
  };

  void writeValue(const PropertyListValue& value) {
    if (isPropertyListContainer(value)) return open(value);
    if (const auto* data = value.data()) return writeTagged("$data", base64(data->bytes()));
    if (const auto* date = value.date()) return writeTagged("$date", iso8601(*date));
    if (const auto* number = value.floatingPoint()) {
      text_ += finiteNumber(*number).dump();
    } else if (const auto* text = value.string()) {
      text_ += dumped(*text);
    } else if (const auto* integer = value.integer()) {
      text_ += std::to_string(*integer);
    } else {
      text_ += *value.boolean() ? "true" : "false";
    }
  }

  void writeTagged(std::string_view tag, const std::string& text) {
    text_ += '{';
    beginLine(1);
    text_ += dumped(tag) + ": " + dumped(text);
    beginLine();
    text_ += '}';
  }

  void open(const PropertyListValue& container) {
    const PropertyListChildren children(container);
    if (children.atEnd()) {
      text_ += children.isDictionary() ? "{}" : "[]";
      return;
    }
    text_ += children.isDictionary() ? '{' : '[';
    open_.push_back({children});
  }

  void writeNextChild() {
    auto& [children, isFirst] = open_.back();
    if (children.atEnd()) {
      const char bracket = children.isDictionary() ? '}' : ']';
      open_.pop_back();
      beginLine();
      text_ += bracket;
      return;
    }
    if (!std::exchange(isFirst, false)) text_ += ',';
    beginLine();
    if (children.isDictionary()) text_ += dumped(children.key()) + ": ";
    writeValue(children.next());
  }

  void beginLine(std::size_t deeper = 0) {
    text_ += '\n';
    text_.append(2 * std::min(depth_ + open_.size() + deeper, deepestIndentation), ' ');
  }

  const std::size_t depth_;
  std::vector<OpenContainer> open_;
  std::string text_;
};

}  // namespace

ordered_json finiteNumber(double number) {
  if (!std::isfinite(number)) throw NotRepresentable("JSON has no form for a number that is not finite.");
  return number;
}

std::string dumped(const ordered_json& value) {
  return printableJSON(value.dump(2, ' ', false, ordered_json::error_handler_t::replace));
}

std::string jsonText(const PropertyListValue& value) { return Writer(0).write(value); }

std::string dumpedWith(const ordered_json& object, std::string_view key, const PropertyListValue& value) {
  auto text = dumped(object);
  text.resize(text.size() - 2);  // a line feed and the bracket
  return text + ",\n  " + dumped(key) + ": " + Writer(1).write(value) + "\n}";
}
