#include "MarletFoundation/Platform/ErrorObject.h"

#include <algorithm>
#include <mutex>
#include <system_error>

#include "MarletFoundation/Platform/Text.h"

namespace MarletFoundation {
namespace {

struct ProviderRegistry {
  std::mutex mutex;
  std::map<std::string, ErrorObject::ValueProvider, std::less<>> providers;
};

ProviderRegistry& registry() {
  // Never destroyed: errors may still be described while the process ends.
  static auto& registry = *new ProviderRegistry;
  return registry;
}

std::optional<std::string> text(const std::optional<UserInfoValue>& value) {
  if (value) {
    if (const auto* string = std::get_if<std::string>(&*value)) return *string;
  }
  return std::nullopt;
}

UserInfo::const_iterator findKey(const UserInfo& info, std::string_view key) {
  return std::find_if(info.begin(), info.end(),
                      [&](const auto& entry) { return canonicallyEquivalent(entry.first, key); });
}

bool equal(const UserInfoValue& a, const UserInfoValue& b) {
  const auto* first = std::get_if<ErrorPointer>(&a);
  const auto* second = std::get_if<ErrorPointer>(&b);
  if (!first || !second || !*first || !*second) return a == b;
  return ErrorObject(**first) == ErrorObject(**second);
}

}  // namespace

UserInfoValue::UserInfoValue(const UserInfoValue& other) : variant() {
  if (const auto* text = std::get_if<std::string>(&other)) {
    emplace<std::string>(*text);
  } else if (const auto* number = std::get_if<std::int64_t>(&other)) {
    emplace<std::int64_t>(*number);
  } else {
    emplace<ErrorPointer>(std::get<ErrorPointer>(other));
  }
}

ErrorObject::ErrorObject(std::string domain, int code, UserInfo userInfo)
    : domain_(std::move(domain)), code_(code), userInfo_(std::move(userInfo)) {}

ErrorObject::ErrorObject(const Error& error) : domain_(error.domain()), code_(error.code()) {
  if (const auto* object = dynamic_cast<const ErrorObject*>(&error)) {
    userInfo_ = object->userInfo_;
    original_ = object->original_;
  } else {
    original_ = error.copy();
  }
}

ErrorObject ErrorObject::withMessage(std::string_view domain, int code, std::string message,
                                     ErrorPointer underlying) {
  UserInfo info{{std::string(LocalizedDescriptionKey), std::move(message)}};
  if (underlying) info.emplace(UnderlyingErrorKey, std::make_shared<ErrorObject>(*underlying));
  return {std::string(domain), code, std::move(info)};
}

ErrorObject ErrorObject::posix(int errorNumber, std::string_view path) {
  UserInfo info{{std::string(LocalizedDescriptionKey), std::generic_category().message(errorNumber)},
                {std::string(FilePathKey), std::string(path)}};
  return {std::string(PosixErrorDomain), errorNumber, std::move(info)};
}

std::string ErrorObject::description() const {
  return "Error(domain: " + domain_ + ", code: " + std::to_string(code_) + ", " +
         quoted(localizedDescription()) + ")";
}

ErrorPointer ErrorObject::underlyingError() const {
  if (const auto found = value(UnderlyingErrorKey)) {
    if (const auto* error = std::get_if<ErrorPointer>(&*found)) return *error;
  }
  return original_ ? original_->underlyingError() : nullptr;
}

std::optional<UserInfoValue> ErrorObject::value(std::string_view key) const {
  const auto own = findKey(userInfo_, key);
  if (own != userInfo_.end()) return own->second;
  const auto provider = valueProvider(domain_);
  return provider ? provider(*this, key) : std::nullopt;
}

std::string ErrorObject::localizedDescription() const {
  if (auto words = text(value(LocalizedDescriptionKey))) return *words;
  return "The operation could not be completed. (" + domain_ + " error " + std::to_string(code_) + ".)";
}

std::optional<std::string> ErrorObject::localizedFailureReason() const {
  return text(value(LocalizedFailureReasonKey));
}

std::optional<std::string> ErrorObject::localizedRecoverySuggestion() const {
  return text(value(LocalizedRecoverySuggestionKey));
}

bool ErrorObject::operator==(const ErrorObject& other) const {
  return domain_ == other.domain_ && code_ == other.code_ && userInfo_.size() == other.userInfo_.size() &&
         std::all_of(userInfo_.begin(), userInfo_.end(), [&](const auto& entry) {
           const auto same = findKey(other.userInfo_, entry.first);
           return same != other.userInfo_.end() && equal(entry.second, same->second);
         });
}

void ErrorObject::setValueProvider(std::string domain, ValueProvider provider) {
  const std::lock_guard lock(registry().mutex);
  registry().providers.insert_or_assign(std::move(domain), std::move(provider));
}

ErrorObject::ValueProvider ErrorObject::valueProvider(std::string_view domain) {
  const std::lock_guard lock(registry().mutex);
  const auto found = registry().providers.find(domain);
  return found == registry().providers.end() ? ValueProvider() : found->second;
}

}  // namespace MarletFoundation
