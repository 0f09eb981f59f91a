#pragma once

#include <cstdint>
#include <functional>
#include <optional>
#include <string>
#include <string_view>

#include "MarletFoundation/Platform/ErrorObject.h"
#include "MarletFoundation/Platform/URL.h"

namespace MarletFoundation {

/// What the library asks of its host: places, settings and sinks. A host that wants others than the defaults
/// sets them once, at start-up, before it uses the library.
struct MARLET_EXPORT HostEnvironment {
  /// The user's documents. Default: XDG_DOCUMENTS_DIR, else ~/Documents, where the home is HOME, else what the
  /// system's list of users says; nothing for a user whom that doesn't know.
  std::optional<URL> documentsDirectory;
  /// Where the library keeps support files. Default: XDG_DATA_HOME, else ~/.local/share.
  std::optional<URL> applicationSupportDirectory;
  /// The shared container of an app group, or nothing. Default: a directory of that name in the support
  /// directory.
  std::function<std::optional<URL>(std::string_view identifier)> groupContainer;
  /// Where "Targets" and "Toolchain" lie. Default: MARLET_RESOURCES, else those installed, or built, with the
  /// library.
  std::optional<URL> resourcesDirectory;
  /// The integer under a user-default key, or nothing. Default: the environment variable
  /// MARLET_DEFAULTS_<key>.
  std::function<std::optional<std::int64_t>(std::string_view key)> userDefault;
  /// Takes one entry of the system log. Default: syslog.
  std::function<void(std::string_view entry)> systemLog;
  /// Takes one line of diagnostics, without its line feed. Default: standard output.
  std::function<void(std::string_view line)> diagnostics;
  /// Told of what should be gone after a write and couldn't be removed: where it lies and why it stays; it may go by
  /// hand. On the thread that wrote. Default: an entry of the system log.
  std::function<void(std::string_view path, const ErrorObject& reason)> leftBehind;

  static HostEnvironment defaults();
  /// The environment in force, the defaults unless a host set another. May be called from any thread; the
  /// reference stays valid for the life of the process, also when another environment is set.
  static const HostEnvironment& current();
  /// Any thread. Every environment ever set is kept, so this is for start-up and for tests, not for traffic.
  static void setCurrent(HostEnvironment environment);
};

/// "PATH couldn't be removed and may go by hand: REASON", for who shows what was left behind.
MARLET_EXPORT std::string leftBehindSentence(std::string_view path, const ErrorObject& reason);

}  // namespace MarletFoundation
