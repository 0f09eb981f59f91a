#pragma once

#include <string>
#include <utility>

#include "MarletFoundation/Platform/UserDefaults.h"

namespace MarletFoundation {

/// A setting that is on or off, read once, when this is made.
struct UserDefaultBoolKey {
  std::string name;
  bool isEnabled;

  /// Registers the default first.
  UserDefaultBoolKey(std::string itsName, bool defaultValue)
      : name(std::move(itsName)),
        isEnabled((UserDefaults::registerDefault(name, defaultValue), UserDefaults::boolean(name))) {}
};

}  // namespace MarletFoundation
