#include "MarletFoundation/Platform/Host.h"

#include <sys/random.h>
#include <sys/utsname.h>
#include <unistd.h>

#include <array>
#include <cerrno>
#include <cstdint>

#include "MarletFoundation/Platform/FatalError.h"
#include "MarletFoundation/Platform/HostEnvironment.h"

namespace MarletFoundation {
namespace {

thread_local std::string threadName;

}  // namespace

std::string MLFGetHostArchitectureName() {
  utsname names{};
  ::uname(&names);
  const std::string machine = names.machine;
  return machine == "aarch64" ? "arm64" : machine;
}

std::string randomUUIDString() {
  std::array<std::uint8_t, 16> bytes;
  while (::getrandom(bytes.data(), bytes.size(), 0) != static_cast<ssize_t>(bytes.size())) {
    if (errno != EINTR) fatalError("the system has no random numbers");
  }
  bytes[6] = static_cast<std::uint8_t>((bytes[6] & 0x0F) | 0x40);  // version 4
  bytes[8] = static_cast<std::uint8_t>((bytes[8] & 0x3F) | 0x80);  // RFC 4122 variant
  std::string text;
  for (std::size_t i = 0; i < bytes.size(); ++i) {
    if (i == 4 || i == 6 || i == 8 || i == 10) text += '-';
    text += "0123456789ABCDEF"[bytes[i] >> 4];
    text += "0123456789ABCDEF"[bytes[i] & 15];
  }
  return text;
}

std::optional<URL> libraryResourcesURL() { return HostEnvironment::current().resourcesDirectory; }

std::string currentThreadName() { return threadName; }

void setCurrentThreadName(std::string name) { threadName = std::move(name); }

bool isMainThread() {
  thread_local const bool main = ::gettid() == ::getpid();
  return main;
}

}  // namespace MarletFoundation
