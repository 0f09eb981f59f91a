#include "MarletFoundation/DerivedData/DerivedDataManager.h"

#include <algorithm>
#include <filesystem>

#include "MarletFoundation/Data/PropertyListSerializable.h"
#include "MarletFoundation/Environment/Target.h"
#include "MarletFoundation/Logging/Log.h"
#include "MarletFoundation/Platform/FatalError.h"
#include "MarletFoundation/Platform/FileManager.h"
#include "MarletFoundation/Platform/HostEnvironment.h"
#include "MarletFoundation/Version/MarletFoundationVersion.h"

namespace MarletFoundation {
namespace {

constexpr std::string_view versionKey = "MarletFoundationVersion";
constexpr std::string_view sdkRootKey = "SDKRoot";

const LogAspect& logAspect() {
  // Never destroyed: other static objects may still ask, and removals log, while the process ends.
  static const auto& aspect = *new LogAspect("DerivedData");
  return aspect;
}

void report(const std::string& message) {
  Log([&] { return message; }, logAspect(), LogLevel::Critical);
}

void createDirectory(const URL& url) {
  std::error_code failure;
  std::filesystem::create_directories(url.path(), failure);
  if (failure) throw ErrorObject::posix(failure.value(), url.path());
}

URL groupContainer() {
  const auto& groupContainer = HostEnvironment::current().groupContainer;
  if (auto url = groupContainer ? groupContainer("group.CompilerDerivedData") : std::nullopt) return *url;
  fatalError(
      "Unable to get the dervied data container URL; is the calling process a member of the "
      "'group.CompilerDerivedData' app group?");
}

URL applicationSupportDirectory() {
  try {
    const auto& url = HostEnvironment::current().applicationSupportDirectory;
    if (!url) throw ErrorObject::posix(ENOENT, "application support");
    createDirectory(*url);
    return *url;
  } catch (const ErrorObject& error) {
    fatalError("Unable to get the private derived data URL: " + error.description());
  }
}

std::optional<std::string> sdkRoot() {
  const auto target = Target::targetWithIdentifier("slateos");
  return target ? std::optional(target->SDKRoot.path()) : std::nullopt;
}

/// A document's name may hold what no directory's can.
std::string directoryName(std::string_view name, std::string_view uniquifier) {
  auto whole = std::string(name) + "-" + std::string(uniquifier);
  std::replace_if(
      whole.begin(), whole.end(), [](char c) { return c == '/' || c == '\0'; }, '_');
  return whole;
}

std::function<void(const std::optional<ErrorObject>&)> reportingRemoval(const URL& url) {
  return [url](const std::optional<ErrorObject>& error) {
    if (error)
      report("Failed to asynchronously remove item at '" + url.absoluteString() +
             "': " + error->description());
  };
}

void removeAndCreateDirectory(const URL& url) {
  try {
    FileManager::asynchronouslyRemoveItem(url, reportingRemoval(url));
  } catch (const ErrorObject& error) {
    if (error.domain() != PosixErrorDomain || error.code() != ENOENT) throw;
  }
  createDirectory(url);
}

}  // namespace

const DerivedDataManager& DerivedDataManager::sharedDerivedDataManager() {
  static const auto& manager = *new DerivedDataManager;
  return manager;
}

DerivedDataManager::DerivedDataManager()
    : containerURL(groupContainer()),
      derivedDataURL(containerURL.appendingPathComponent("DerivedData", true)),
      privateDerivedDataURL(applicationSupportDirectory().appendingPathComponent("PrivateDerivedData", true)),
      moduleCacheURL(containerURL.appendingPathComponent("Library/Caches/ModuleCache", true)),
      codeCompletionCacheURL(
          containerURL.appendingPathComponent("Library/Caches/CodeCompletionCache", true)) {
  resetDerivedDataIfNecessary();
}

URL DerivedDataManager::infoURL() const {
  return derivedDataURL.appendingPathComponent("DerivedDataInfo.plist");
}

bool DerivedDataManager::mustReset() const {
  PropertyListValue info;
  try {
    info = PropertyListSerialization::read(FileManager::readFile(infoURL()));
  } catch (const Error&) {
    return true;
  }
  const auto* dictionary = info.dictionary();
  if (!dictionary) return true;
  const auto stringAt = [&](std::string_view key) -> const std::string* {
    const auto* value = dictionary->find(key);
    return value ? value->string() : nullptr;
  };
  const auto* version = stringAt(versionKey);
  if (!version || *version != MarletFoundationVersionString) return true;
  const auto* known = stringAt(sdkRootKey);
  if (!known) return true;
  const auto current = sdkRoot();
  return !current || *current != *known;
}

void DerivedDataManager::resetDerivedDataIfNecessary() const {
  const auto wiped = {&derivedDataURL, &privateDerivedDataURL, &moduleCacheURL, &codeCompletionCacheURL};
  for (const auto* url : wiped) FileManager::finishRemovals(*url, reportingRemoval(*url));
  if (!mustReset()) return;
  try {
    for (const auto* url : wiped) removeAndCreateDirectory(*url);
  } catch (const ErrorObject& error) {
    return report("Failed to wipe data: " + error.description());
  }
  writeInfo();
}

void DerivedDataManager::writeInfo() const {
  const auto root = sdkRoot();
  if (!root) return;
  const PropertyListDictionary info{{versionKey, MarletFoundationVersionString}, {sdkRootKey, *root}};
  try {
    FileManager::writeFileAtomically(infoURL(),
                                     PropertyListSerialization::write(info, PropertyListFormat::xml));
  } catch (const ErrorObject& error) {
    report("Failed to write out DerivedDataInfo.plist: " + error.description());
  }
}

URL DerivedDataManager::derivedDataDirectoryURLForMarletWithName(std::string_view name,
                                                                 std::string_view uniquifier,
                                                                 bool createIfNecessary, bool shared) const {
  auto directory = (shared ? derivedDataURL : privateDerivedDataURL)
                       .appendingPathComponent(directoryName(name, uniquifier), true);
  if (!createIfNecessary) return directory;
  try {
    createDirectory(directory);
  } catch (const ErrorObject& error) {
    report("Failed to create DerivedData directory: " + error.description());
  }
  return directory;
}

URL DerivedDataManager::subdirectoryURL(const URL& directory, std::string_view name,
                                        bool createIfNecessary) const {
  auto subdirectory = directory.appendingPathComponent(name, true);
  if (!createIfNecessary) return subdirectory;
  try {
    createDirectory(subdirectory);
  } catch (const ErrorObject& error) {
    report("Failed to create DerivedData subdirectory: " + error.description());
  }
  return subdirectory;
}

URL DerivedDataManager::buildDirectoryURLForMarletWithName(std::string_view name, std::string_view uniquifier,
                                                           bool createIfNecessary, bool shared) const {
  const auto directory =
      derivedDataDirectoryURLForMarletWithName(name, uniquifier, createIfNecessary, shared);
  return subdirectoryURL(directory, "Build", createIfNecessary);
}

URL DerivedDataManager::resourcesBundlesDirectoryURLForMarletWithName(std::string_view name,
                                                                      std::string_view uniquifier,
                                                                      bool createIfNecessary) const {
  const auto directory = derivedDataDirectoryURLForMarletWithName(name, uniquifier, createIfNecessary);
  return subdirectoryURL(directory, "ResourcesBundles", createIfNecessary);
}

}  // namespace MarletFoundation
