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

/// Data as `{"$data": base64}`, a date as `{"$date": ISO 8601}`, the rest as itself. Throws
/// `NotRepresentable` for numbers that are not finite and dates beyond the years 0 to 9999.
nlohmann::ordered_json json(const MarletFoundation::PropertyListValue& value);

template <class T>
nlohmann::ordered_json orNull(const std::optional<T>& value) {
  return value ? nlohmann::ordered_json(*value) : nlohmann::ordered_json(nullptr);
}

/// Indented, in UTF-8, safe on a terminal (`printableJSON`); ill-formed bytes, which only paths can hold, as U+FFFD.
std::string dumped(const nlohmann::ordered_json& value);
