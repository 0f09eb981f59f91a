#include "MarletFoundation/Platform/SecurityScope.h"

#include <openssl/crypto.h>
#include <openssl/evp.h>
#include <openssl/hmac.h>
#include <sys/random.h>
#include <sys/stat.h>
#include <unistd.h>

#include <array>
#include <filesystem>
#include <map>
#include <mutex>

#include "MarletFoundation/Platform/Descriptor.h"
#include "MarletFoundation/Platform/Digest.h"
#include "MarletFoundation/Platform/FatalError.h"
#include "MarletFoundation/Platform/Host.h"
#include "MarletFoundation/Platform/HostEnvironment.h"

namespace MarletFoundation::SecurityScope {
namespace {

using Secret = std::array<char, 32>;

// A token: this, 64 hexadecimal digits of its signature, ";" and the path.
constexpr std::string_view readPrefix = "marlet-scope;1;read;";

/// The user's secret. Nothing, with errno set, unless it is one that nobody else can read.
std::optional<Secret> readSecret(const std::string& path) {
  const Descriptor file(retrying([&] { return ::open(path.c_str(), ReadingFlags | O_NOFOLLOW); }));
  struct stat status;
  if (!file || ::fstat(file.get(), &status) != 0) return std::nullopt;
  Secret secret;
  if (S_ISREG(status.st_mode) && status.st_uid == ::geteuid() && (status.st_mode & 077) == 0 &&
      ::pread(file.get(), secret.data(), secret.size(), 0) == static_cast<ssize_t>(secret.size()))
    return secret;
  errno = EPERM;
  return std::nullopt;
}

/// Makes the secret as a whole or not at all; one that another process makes meanwhile stays.
void makeSecret(const std::string& path) {
  Secret secret;
  if (::getrandom(secret.data(), secret.size(), 0) != static_cast<ssize_t>(secret.size())) return;
  const auto unfinished = path + "." + randomUUIDString();
  const Descriptor file(::open(unfinished.c_str(), O_WRONLY | O_CREAT | O_EXCL | O_CLOEXEC, 0600));
  if (!file) return;
  if (writeAll(file.get(), {secret.data(), secret.size()}) == 0 && ::fsync(file.get()) == 0)
    ::link(unfinished.c_str(), path.c_str());
  ::unlink(unfinished.c_str());
}

std::optional<Secret> userSecret() {
  const auto& support = HostEnvironment::current().applicationSupportDirectory;
  if (!support) {
    errno = ENOENT;
    return std::nullopt;
  }
  const auto directory = support->appendingPathComponent("MarletFoundation", true).path();
  const auto path = directory + "/SandboxSecret";
  if (auto secret = readSecret(path); secret || errno != ENOENT) return secret;
  std::error_code failure;
  std::filesystem::create_directories(directory, failure);
  makeSecret(path);
  return readSecret(path);
}

std::string signatureOf(std::string_view text, const Secret& secret) {
  std::array<unsigned char, EVP_MAX_MD_SIZE> digest;
  unsigned size = 0;
  if (!::HMAC(::EVP_sha256(), secret.data(), static_cast<int>(secret.size()),
              reinterpret_cast<const unsigned char*>(text.data()), text.size(), digest.data(), &size))
    fatalError("A digest is not available");
  return hexadecimal({digest.data(), size});
}

std::string tokenFor(const std::string& path, const Secret& secret) {
  const auto prefix = std::string(readPrefix);
  return prefix + signatureOf(prefix + path, secret) + ";" + path;
}

bool isReadable(const std::string& path) {
  return ::faccessat(AT_FDCWD, path.c_str(), R_OK, AT_EACCESS) == 0;
}

bool isGood(const std::string& token, const std::string& path) {
  struct stat status;
  if (::lstat(path.c_str(), &status) != 0 || S_ISLNK(status.st_mode) || !isReadable(path)) return false;
  const auto secret = userSecret();
  if (!secret) return false;
  const auto expected = tokenFor(path, *secret);
  return token.size() == expected.size() && ::CRYPTO_memcmp(token.data(), expected.data(), token.size()) == 0;
}

struct Accesses {
  std::mutex mutex;
  std::map<std::string, std::size_t> counts;
};

Accesses& accesses() {
  // Never destroyed: a resource may be given up while the process ends.
  static auto& accesses = *new Accesses;
  return accesses;
}

}  // namespace

std::optional<std::string> issueSandboxExtension(const std::string& path) {
  if (!isReadable(path)) return std::nullopt;
  const auto secret = userSecret();
  return secret ? std::optional(tokenFor(path, *secret)) : std::nullopt;
}

std::optional<std::string> copySecurityScope(const URL& url) { return url.securityScope(); }

URL attachSecurityScope(const URL& url, std::string token) {
  return url.attachingSecurityScope(std::move(token));
}

bool startAccessingSecurityScopedResource(const URL& url) {
  const auto token = url.securityScope();
  const auto path = fileSystemPath(url);
  if (!token || !path || !isGood(*token, *path)) return false;
  const std::lock_guard lock(accesses().mutex);
  ++accesses().counts[*path];
  return true;
}

void stopAccessingSecurityScopedResource(const URL& url) {
  const std::lock_guard lock(accesses().mutex);
  auto& counts = accesses().counts;
  const auto known = counts.find(url.path());
  if (known != counts.end() && --known->second == 0) counts.erase(known);
}

std::size_t accessCount(const URL& url) {
  const std::lock_guard lock(accesses().mutex);
  const auto known = accesses().counts.find(url.path());
  return known == accesses().counts.end() ? 0 : known->second;
}

}  // namespace MarletFoundation::SecurityScope
