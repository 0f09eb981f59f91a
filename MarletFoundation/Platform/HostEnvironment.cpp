#include "MarletFoundation/Platform/HostEnvironment.h"

#include <dlfcn.h>
#include <link.h>
#include <pwd.h>
#include <syslog.h>
#include <unistd.h>

#include <atomic>
#include <cstdio>
#include <cstdlib>
#include <forward_list>
#include <mutex>
#include <vector>

#include "MarletFoundation/Platform/Descriptor.h"
#include "MarletFoundation/Platform/Error.h"
#include "MarletFoundation/Platform/FileManager.h"
#include "MarletFoundation/Platform/Text.h"

namespace MarletFoundation {
namespace {

/// The directory that an environment variable names; a relative path counts as none.
std::optional<URL> directoryFromEnvironment(const char* variable) {
  const char* path = std::getenv(variable);
  return path && *path == '/' ? std::optional(URL::file(path, true)) : std::nullopt;
}

/// A process may run without HOME, as services do; its user has one all the same.
std::optional<URL> homeDirectory() {
  if (auto named = directoryFromEnvironment("HOME")) return named;
  std::vector<char> buffer(1024);
  passwd entry;
  passwd* found = nullptr;
  while (::getpwuid_r(::geteuid(), &entry, buffer.data(), buffer.size(), &found) == ERANGE)
    buffer.resize(2 * buffer.size());
  return found && found->pw_dir && *found->pw_dir == '/' ? std::optional(URL::file(found->pw_dir, true))
                                                         : std::nullopt;
}

std::optional<URL> directoryInHome(const char* variable, std::string_view pathInHome) {
  if (auto named = directoryFromEnvironment(variable)) return named;
  const auto home = homeDirectory();
  return home ? std::optional(home->appendingPathComponent(pathInHome, true)) : std::nullopt;
}

bool isDirectory(const URL& url) {
  try {
    return FileManager::isDirectory(url);
  } catch (const Error&) {
    return false;
  }
}

/// The file that holds this code: the library, or a program that was linked with it statically. The name that a program
/// was started under may be a relative one, which whoever chooses the working directory would give a meaning.
std::optional<URL> ownBinary() {
  Dl_info library{};
  link_map* map = nullptr;
  if (!::dladdr1(reinterpret_cast<const void*>(&ownBinary), &library, reinterpret_cast<void**>(&map),
                 RTLD_DL_LINKMAP) ||
      !map) {
    return std::nullopt;
  }
  return URL::file(*map->l_name ? map->l_name : "/proc/self/exe");
}

/// The resources lie in the prefix that the library was installed to, or built in, one or, where the system has a
/// directory for each architecture, two directories up.
std::optional<URL> installedResources() {
  const auto binary = ownBinary();
  if (!binary) return std::nullopt;
  auto prefix = binary->resolvingSymlinksInPath().deletingLastPathComponent();
  for (int level = 0; level < 2; ++level) {
    prefix = prefix.deletingLastPathComponent();
    auto resources = prefix.appendingPathComponent("share/marlet-foundation", true);
    if (isDirectory(resources)) return resources;
  }
  return std::nullopt;
}

std::optional<URL> findResources() {
  if (const char* path = std::getenv("MARLET_RESOURCES"); path && *path) {
    if (auto named = URL::file(path, true); isDirectory(named)) return named;
  }
  return installedResources();
}

std::optional<std::int64_t> userDefaultFromEnvironment(std::string_view key) {
  if (key.empty() || key.find_first_of(std::string_view("=\0", 2)) != std::string_view::npos)
    return std::nullopt;
  const char* value = std::getenv(("MARLET_DEFAULTS_" + std::string(key)).c_str());
  return value ? parseDecimalInteger(value) : std::nullopt;
}

void writeLineToStandardOutput(std::string_view line) {
  const std::string whole = std::string(line) + "\n";
  std::fwrite(whole.data(), 1, whole.size(), stdout);
  std::fflush(stdout);
}

/// Every environment that was ever in force, so that what `current` returned stays valid.
struct Environments {
  std::mutex mutex;
  std::forward_list<HostEnvironment> all;
  std::atomic<const HostEnvironment*> current{nullptr};

  const HostEnvironment& add(HostEnvironment environment) {
    all.push_front(std::move(environment));
    current.store(&all.front(), std::memory_order_release);
    return all.front();
  }
};

Environments& environments() {
  // Never destroyed: other static objects may still log while the process ends.
  static auto& environments = *new Environments;
  return environments;
}

}  // namespace

HostEnvironment HostEnvironment::defaults() {
  HostEnvironment environment;
  environment.documentsDirectory = directoryInHome("XDG_DOCUMENTS_DIR", "Documents");
  environment.applicationSupportDirectory = directoryInHome("XDG_DATA_HOME", ".local/share");
  environment.groupContainer =
      [support = environment.applicationSupportDirectory](std::string_view identifier) -> std::optional<URL> {
    if (!support || !isFileName(identifier)) return std::nullopt;
    return support->appendingPathComponent(identifier, true);
  };
  environment.resourcesDirectory = findResources();
  environment.userDefault = userDefaultFromEnvironment;
  environment.systemLog = [](std::string_view entry) {
    ::syslog(LOG_USER | LOG_NOTICE, "%s", std::string(entry).c_str());
  };
  environment.diagnostics = writeLineToStandardOutput;
  environment.leftBehind = [](std::string_view path, const ErrorObject& reason) {
    ::syslog(LOG_USER | LOG_WARNING, "%s", leftBehindSentence(path, reason).c_str());
  };
  return environment;
}

const HostEnvironment& HostEnvironment::current() {
  auto& known = environments();
  if (const auto* environment = known.current.load(std::memory_order_acquire)) return *environment;
  const std::lock_guard lock(known.mutex);
  if (const auto* environment = known.current.load(std::memory_order_acquire)) return *environment;
  return known.add(defaults());
}

void HostEnvironment::setCurrent(HostEnvironment environment) {
  auto& known = environments();
  const std::lock_guard lock(known.mutex);
  known.add(std::move(environment));
}

std::string leftBehindSentence(std::string_view path, const ErrorObject& reason) {
  return std::string(path) + " couldn't be removed and may go by hand: " + reason.localizedDescription();
}

}  // namespace MarletFoundation
