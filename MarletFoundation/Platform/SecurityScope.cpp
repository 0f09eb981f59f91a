#include "MarletFoundation/Platform/SecurityScope.h"

#include <openssl/crypto.h>
#include <openssl/evp.h>
#include <openssl/hmac.h>
#include <sys/random.h>
#include <sys/stat.h>
#include <unistd.h>

#include <array>
#include <climits>
#include <cstdint>
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

// A token: this, 64 hexadecimal digits of its signature, ";" and what the grant is for.
constexpr std::string_view readPrefix = "marlet-scope;2;read;";

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

std::string tokenFor(const std::string& item, const Secret& secret) {
  const auto prefix = std::string(readPrefix);
  return prefix + signatureOf(prefix + item, secret) + ";" + item;
}

/// What lies at a path, opened without being read: all that is asked of it later is asked of this one thing, whatever
/// comes to lie at the path. Directories on the way may be links; the last name isn't followed.
class Item {
 public:
  /// False when nothing was found, with errno set.
  explicit operator bool() const { return static_cast<bool>(opened_); }

  static Item at(std::string path) {
    // Behind a "." nothing is called a link any more.
    while (path.size() > 1 && (path.ends_with('/') || path.ends_with("/."))) path.pop_back();
    Item item;
    if (path.ends_with("/..")) {
      errno = EINVAL;
      return item;
    }
    item.opened_ =
        Descriptor(retrying([&] { return ::open(path.c_str(), O_PATH | O_NOFOLLOW | O_CLOEXEC); }));
    constexpr auto wanted = STATX_TYPE | STATX_INO | STATX_BTIME;
    if (item.opened_ && ::statx(item.opened_.get(), "", AT_EMPTY_PATH, wanted, &item.facts_) != 0)
      item.opened_ = Descriptor();
    return item;
  }

  bool isLink() const { return S_ISLNK(facts_.stx_mode); }
  bool isReadable() const { return ::faccessat(AT_FDCWD, link().c_str(), R_OK, AT_EACCESS) == 0; }

  /// The file and its place, as a token names them: device, number, the time when it was made, since numbers are used
  /// again, and the path without links. Nothing, with errno set, when that path can't be had.
  std::optional<std::string> name() const {
    std::array<char, PATH_MAX> place;
    const auto length = ::readlink(link().c_str(), place.data(), place.size());
    if (length < 0) return std::nullopt;
    const auto& made = facts_.stx_btime;
    const std::uint64_t numbers[] = {facts_.stx_dev_major, facts_.stx_dev_minor, facts_.stx_ino,
                                     static_cast<std::uint64_t>(made.tv_sec), made.tv_nsec};
    std::string name;
    for (const auto number : numbers) name += std::to_string(number) + ".";
    name.back() = ';';
    return name.append(place.data(), static_cast<std::size_t>(length));
  }

 private:
  std::string link() const { return "/proc/self/fd/" + std::to_string(opened_.get()); }

  Descriptor opened_;
  struct statx facts_ {};
};

/// The token of what lies at the path; nothing, with errno set, when there can't be one.
std::optional<std::string> tokenForPath(const std::string& path) {
  const auto item = Item::at(path);
  if (item && item.isLink()) errno = ELOOP;
  if (!item || item.isLink() || !item.isReadable()) return std::nullopt;
  const auto name = item.name();
  const auto secret = name ? userSecret() : std::nullopt;
  return secret ? std::optional(tokenFor(*name, *secret)) : std::nullopt;
}

bool isGood(const std::string& token, const std::string& path) {
  const auto expected = tokenForPath(path);
  return expected && token.size() == expected->size() &&
         ::CRYPTO_memcmp(token.data(), expected->data(), token.size()) == 0;
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

std::optional<bool> isSymbolicLink(const std::string& path) {
  const auto item = Item::at(path);
  return item ? std::optional(item.isLink()) : std::nullopt;
}

std::optional<std::string> issueSandboxExtension(const std::string& path) { return tokenForPath(path); }

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
