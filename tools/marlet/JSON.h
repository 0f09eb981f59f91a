#pragma once

#include <nlohmann/json.hpp>
#include <optional>
#include <stdexcept>
#include <string>

#include "MarletFoundation/Data/PropertyListValue.h"

/// A value that JSON has no form for.
struct NotRepresentable : std::runtime_error {
  using std::runtime_error::runtime_error;
};

/// Throws `NotRepresentable` for one that is not finite.
nlohmann::ordered_json finiteNumber(double number);

template <class T>
nlohmann::ordered_json orNull(const std::optional<T>& value) {
  return value ? nlohmann::ordered_json(*value) : nlohmann::ordered_json(nullptr);
}

/// Indented, in UTF-8, safe on a terminal (`printableJSON`); ill-formed bytes, which only paths can hold, as U+FFFD.
std::string dumped(const nlohmann::ordered_json& value);

/// A property list of any size and depth, in the form of `dumped`: data as `{"$data": base64}`, a date as
/// `{"$date": ISO 8601}`, the rest as itself; beyond 512 levels indented no further. Throws `NotRepresentable` for
/// numbers that are not finite and dates beyond the years 0 to 9999.
std::string jsonText(const MarletFoundation::PropertyListValue& value);
/// An object that isn't empty, with a property list under one more key behind its own.
std::string dumpedWith(const nlohmann::ordered_json& object, std::string_view key,
                       const MarletFoundation::PropertyListValue& value);
