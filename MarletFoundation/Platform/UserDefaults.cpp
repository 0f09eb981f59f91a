#include "MarletFoundation/Platform/UserDefaults.h"

#include <map>
#include <mutex>
#include <string>

#include "MarletFoundation/Platform/HostEnvironment.h"

namespace MarletFoundation::UserDefaults {
namespace {

struct Registered {
  std::mutex mutex;
  std::map<std::string, bool, std::less<>> values;
};

Registered& registered() {
  static auto& registered = *new Registered;
  return registered;
}

}  // namespace

void registerDefault(std::string_view key, bool value) {
  const std::lock_guard lock(registered().mutex);
  registered().values.insert_or_assign(std::string(key), value);
}

bool boolean(std::string_view key) {
  const auto& userDefault = HostEnvironment::current().userDefault;
  if (const auto value = userDefault ? userDefault(key) : std::nullopt) return *value != 0;
  const std::lock_guard lock(registered().mutex);
  const auto found = registered().values.find(key);
  return found != registered().values.end() && found->second;
}

}  // namespace MarletFoundation::UserDefaults
