#pragma once

#include <concepts>
#include <cstdint>
#include <map>
#include <optional>
#include <string>
#include <variant>
#include <vector>

#include "MarletFoundation/Data/CaseError.h"
#include "MarletFoundation/Platform/PropertyListObject.h"

namespace MarletFoundation {

/// A JSON value. Two are equal when they are the same case with equal payloads: an integer never equals a
/// double or a boolean.
struct MARLET_EXPORT JSON {
  enum class Kind { double_, integer, boolean, string, array, dictionary, null };
  using Array = std::vector<JSON>;
  using Dictionary = std::map<std::string, JSON, std::less<>>;
  /// The cases in the order of `Kind`.
  using Payload = std::variant<double, std::int64_t, bool, std::string, Array, Dictionary, std::monostate>;

  Payload payload = std::monostate();

  JSON() = default;
  /// The case that holds the value's type.
  template <class Value>
  requires(std::constructible_from<Payload, Value> &&
           !std::same_as<std::remove_cvref_t<Value>, JSON>) explicit JSON(Value&& value)
      : payload(std::forward<Value>(value)) {}
  /// Parses. Throws what `JSONSerialization::read` throws.
  explicit JSON(const Data& data);
  /// Converts a tree of objects. Throws `JSONError` `InvalidType` for kinds that JSON hasn't, keys that aren't
  /// strings, and what lies deeper than `JSONSerialization` reads.
  explicit JSON(const PropertyListObject& object);

  Kind kind() const { return static_cast<Kind>(payload.index()); }

  bool operator==(const JSON& other) const { return payload == other.payload; }
};

/// "double", "integer", "boolean", "string", "array", "dictionary" or "null".
MARLET_EXPORT std::string_view description(JSON::Kind kind);

enum class JSONErrorCase {
  DecodingTypeMismatch,
  InvalidType,
  UnexpectedOptional,
};
MARLET_EXPORT const ErrorTable& errorTable(JSONErrorCase);

class MARLET_EXPORT JSONError final : public BasicCaseError<JSONError, JSONErrorCase, Error> {
 public:
  explicit JSONError(Case c) : BasicCaseError(c) {}
  /// `DecodingTypeMismatch`, where a value of `expected` was wanted.
  explicit JSONError(JSON::Kind expected)
      : BasicCaseError(Case::DecodingTypeMismatch), expectedKind(expected) {}

  /// There for `DecodingTypeMismatch`.
  std::optional<JSON::Kind> expectedKind;

  /// `DecodingTypeMismatch(integer)`, `InvalidType`
  std::string description() const override;
};

/// How a type is made of a JSON value. A type of the host's own joins in by a constructor that takes the value
/// and may throw.
template <class Value>
struct JSONInitializer;
template <class Value>
requires std::constructible_from<Value, const JSON&>
struct JSONInitializer<Value> {
  static Value init(const JSON& json) { return Value(json); }
};
template <class Value>
concept JSONInitalizable = requires(const JSON& json) {
  JSONInitializer<Value>::init(json);
};
template <class Value>
concept JSONConvertible = JSONInitalizable<Value>;

// Each throws `DecodingTypeMismatch` for a value of another kind.
template <>
struct MARLET_EXPORT JSONInitializer<std::string> {
  static std::string init(const JSON& json);
};
template <>
struct MARLET_EXPORT JSONInitializer<bool> {
  static bool init(const JSON& json);
};
template <>
struct MARLET_EXPORT JSONInitializer<double> {
  static double init(const JSON& json);
};
template <>
struct MARLET_EXPORT JSONInitializer<std::int64_t> {
  static std::int64_t init(const JSON& json);
};
template <JSONInitalizable Value>
Value fromJSON(const JSON& json) {
  return JSONInitializer<Value>::init(json);
}

/// The payload of a case, or a throw of `DecodingTypeMismatch`.
MARLET_EXPORT const JSON::Array& arrayOf(const JSON& json);
MARLET_EXPORT const JSON::Dictionary& dictionaryOf(const JSON& json);

template <JSONConvertible Element>
struct JSONInitializer<std::vector<Element>> {
  static std::vector<Element> init(const JSON& json) {
    std::vector<Element> elements;
    for (const auto& element : arrayOf(json)) elements.push_back(fromJSON<Element>(element));
    return elements;
  }
};
template <JSONConvertible Value>
struct JSONInitializer<std::map<std::string, Value>> {
  static std::map<std::string, Value> init(const JSON& json) {
    std::map<std::string, Value> values;
    for (const auto& [key, value] : dictionaryOf(json)) values.emplace(key, fromJSON<Value>(value));
    return values;
  }
};

/// The decoding operator: `decode<T>(json)`, `decode<std::vector<T>>(json)` and
/// `decode<std::map<std::string, T>>(json)`. An array's and a dictionary's values are decoded one by one, and
/// the first failure ends it.
template <JSONConvertible Value>
Value decode(const JSON& json) {
  return fromJSON<Value>(json);
}
/// Throws `UnexpectedOptional` where there is no value.
template <JSONConvertible Value>
Value decode(const std::optional<JSON>& json) {
  if (!json) throw JSONError(JSONErrorCase::UnexpectedOptional);
  return fromJSON<Value>(*json);
}

}  // namespace MarletFoundation
