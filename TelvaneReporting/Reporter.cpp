#include "TelvaneReporting/Reporter.h"

#include <sys/file.h>
#include <sys/stat.h>
#include <unistd.h>

#include <chrono>
#include <filesystem>
#include <thread>

#include "MarletFoundation/Data/PropertyListSerializable.h"
#include "MarletFoundation/Platform/AppendedFile.h"
#include "MarletFoundation/Platform/FileManager.h"
#include "MarletFoundation/Platform/Host.h"
#include "MarletFoundation/Platform/HostEnvironment.h"
#include "MarletFoundation/Platform/JSONSerialization.h"

namespace TelvaneReporting {
namespace {

using namespace MarletFoundation;

/// Everything lies in this directory, which is made. Throws.
URL directory() {
  const auto& support = HostEnvironment::current().applicationSupportDirectory;
  if (!support) throw ErrorObject::posix(ENOENT, "application support");
  auto url = support->appendingPathComponent("TelvaneReporting");
  std::error_code failure;
  std::filesystem::create_directories(url.path(), failure);
  return url;
}

std::string spoolPath() { return directory().appendingPathComponent("Messages.jsonl").path(); }

/// A file that only one writer at a time has open, for as long as it is. Writers need it for one line, so one that
/// has it for a tenth of a second hangs, and isn't waited for.
Descriptor lockedDirectory() {
  constexpr int attempts = 50;
  const auto path = directory().appendingPathComponent("Lock").path();
  auto lock = openToAppend(path);
  for (int attempt = 1; ::flock(lock.get(), LOCK_EX | LOCK_NB) != 0; ++attempt) {
    if ((errno != EWOULDBLOCK && errno != EINTR) || attempt == attempts)
      throw ErrorObject::posix(errno, path);
    std::this_thread::sleep_for(std::chrono::milliseconds(2));
  }
  return lock;
}

PropertyListObjectPointer objectOf(const Info& info) {
  PropertyListObjects keys;
  PropertyListObjects values;
  for (const auto& [key, value] : info) {
    keys.push_back(std::make_shared<StringObject>(key));
    values.push_back(std::make_shared<StringObject>(value));
  }
  return std::make_shared<PlainDictionary>(values, keys);
}

void appendLine(const std::string& line) {
  const auto lock = lockedDirectory();
  const auto path = spoolPath();
  auto file = openToAppend(path);
  struct stat status;
  if (::fstat(file.get(), &status) != 0) throw ErrorObject::posix(errno, path);
  const auto size = static_cast<std::size_t>(status.st_size);
  if (size > 0 && size + line.size() > Reporter::SpoolLimit) {
    const auto former = directory().appendingPathComponent("Messages.old.jsonl").path();
    if (::rename(path.c_str(), former.c_str()) != 0) throw ErrorObject::posix(errno, former);
    file = openToAppend(path);
    status.st_size = 0;
  }
  if (writeAll(file.get(), line) == 0) return;
  const int failure = errno;
  [[maybe_unused]] const int cut = ::ftruncate(file.get(), status.st_size);
  throw ErrorObject::posix(failure, path);
}

/// The identifiers by key; none where there is no file or another one.
PropertyListDictionary identifiers(const URL& file) {
  try {
    const auto known = PropertyListSerialization::read(FileManager::readFile(file));
    if (const auto* dictionary = known.dictionary()) return *dictionary;
  } catch (const Error&) {
  }
  return {};
}

std::string identifier(const std::string& key, bool isNew) {
  auto made = randomUUIDString();
  try {
    const auto lock = lockedDirectory();
    const auto file = directory().appendingPathComponent("Identifiers.plist");
    auto known = identifiers(file);
    const auto* value = known.find(key);
    if (value && value->string() && !isNew) return *value->string();
    known[key] = made;
    FileManager::writeFileAtomically(file, PropertyListSerialization::write(known, PropertyListFormat::xml));
  } catch (const Error&) {
  }
  return made;
}

}  // namespace

Reporter::Reporter(Info sessionInfo, std::optional<Info> userInfo, Strings frameworksToCheck)
    : sessionInfo_(std::move(sessionInfo)),
      userInfo_(std::move(userInfo)),
      frameworksToCheck_(std::move(frameworksToCheck)) {}

void Reporter::startConfiguration(const std::function<void(const Strings&)>& handler) {
  try {
    PropertyListObjects keys{std::make_shared<StringObject>("session")};
    PropertyListObjects values{objectOf(sessionInfo_)};
    if (userInfo_) {
      keys.push_back(std::make_shared<StringObject>("user"));
      values.push_back(objectOf(*userInfo_));
    }
    appendLine(JSONSerialization::write(PlainDictionary(values, keys)) + "\n");
    isOpen_ = true;
  } catch (const Error&) {
    return handler({});
  }
  Strings results{"spool"};
  for (const auto& framework : frameworksToCheck_) results.push_back("framework " + framework);
  handler(results);
}

void Reporter::sendMessage(std::uint16_t category, std::uint16_t type, const PropertyListObject& payload) {
  if (!isOpen_) throw ErrorObject::withMessage("TelvaneReporting", 0, "No session was begun.");
  appendLine("{\"category\":" + std::to_string(category) + ",\"type\":" + std::to_string(type) +
             ",\"payload\":" + JSONSerialization::write(payload) + "}\n");
}

void Reporter::flushMessages(const std::function<void(const std::optional<ErrorObject>&)>& completion) {
  std::optional<ErrorObject> failure;
  try {
    const auto path = spoolPath();
    if (::fsync(openToAppend(path).get()) != 0) failure = ErrorObject::posix(errno, path);
  } catch (const ErrorObject& error) {
    failure = error;
  }
  if (completion) completion(failure);
}

void Reporter::finishSession() { isOpen_ = false; }

std::string Reporter::persistentIdentifier(const std::string& key) { return identifier(key, false); }
std::string Reporter::regeneratePersistentIdentifier(const std::string& key) { return identifier(key, true); }

}  // namespace TelvaneReporting
