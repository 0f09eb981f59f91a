#pragma once

#include <cstdint>
#include <functional>
#include <map>
#include <optional>
#include <variant>

#include "MarletFoundation/Platform/Error.h"

namespace MarletFoundation {

/// The keys under which an error object keeps what it tells, compared by canonical equivalence.
inline constexpr std::string_view LocalizedDescriptionKey = "LocalizedDescription";
inline constexpr std::string_view LocalizedFailureReasonKey = "LocalizedFailureReason";
inline constexpr std::string_view LocalizedRecoverySuggestionKey = "LocalizedRecoverySuggestion";
inline constexpr std::string_view UnderlyingErrorKey = "UnderlyingError";
inline constexpr std::string_view DebugDescriptionKey = "DebugDescription";
/// Path of the file that a file error is about.
inline constexpr std::string_view FilePathKey = "FilePath";
/// Line of a text, from 1, that a reader's error is about.
inline constexpr std::string_view LineKey = "Line";

/// The domain of file and system errors; the code is errno.
inline constexpr std::string_view PosixErrorDomain = "POSIX";
/// The library's general domain.
inline constexpr std::string_view MarletFoundationErrorDomain = "MarletFoundationErrorDomain";
/// For hosts that make error objects of serialization failures.
inline constexpr std::string_view MarletSerializationErrorDomain = "MarletSerialization";

/// A text, a number, or another error.
struct MARLET_EXPORT UserInfoValue : std::variant<std::string, std::int64_t, ErrorPointer> {
  using variant::variant;
  /// By a hand of its own: the standard library's copy is undefined when it finds no memory for the text.
  UserInfoValue(const UserInfoValue& other);
  UserInfoValue(UserInfoValue&&) noexcept = default;
  UserInfoValue& operator=(UserInfoValue other) noexcept {
    swap(other);
    return *this;
  }
};
using UserInfo = std::map<std::string, UserInfoValue, std::less<>>;

/// The form in which an error reaches a host: domain, code and user info. One that was made from a typed
/// error keeps that error, so that the domain's provider can answer for it.
class MARLET_EXPORT ErrorObject final : public Error {
 public:
  ErrorObject(std::string domain, int code, UserInfo userInfo = {});
  /// The error-object form of any error; an error object gives an equal one.
  explicit ErrorObject(const Error& error);

  /// An error object with a message as its localized description and, unless null, a cause.
  static ErrorObject withMessage(std::string_view domain, int code, std::string message,
                                 ErrorPointer underlying = nullptr);
  /// A file error: domain `PosixErrorDomain`, the system's words for `errorNumber`, and the file's path.
  static ErrorObject posix(int errorNumber, std::string_view path);

  std::string_view domain() const override { return domain_; }
  int code() const override { return code_; }
  /// `Error(domain: D, code: C, "LOCALIZED DESCRIPTION")`
  std::string description() const override;
  ErrorPointer underlyingError() const override;
  ErrorPointer copy() const override { return std::make_shared<ErrorObject>(*this); }
  [[noreturn]] void raise() const override { throw *this; }
  const char* what() const noexcept override { return domain_.c_str(); }

  const UserInfo& userInfo() const { return userInfo_; }
  /// The typed error that this object was made from, or null.
  const ErrorPointer& original() const { return original_; }

  /// What the user info holds under `key`, else what the domain's provider answers, else nothing.
  std::optional<UserInfoValue> value(std::string_view key) const;
  /// The value under `LocalizedDescriptionKey`, else "The operation could not be completed. (DOMAIN error
  /// CODE.)".
  std::string localizedDescription() const;
  std::optional<std::string> localizedFailureReason() const;
  std::optional<std::string> localizedRecoverySuggestion() const;

  /// Domain, code and user info are equal; underlying errors compare by their error-object forms.
  bool operator==(const ErrorObject& other) const;

  /// Answers a key for error objects of one domain, or nothing.
  using ValueProvider = std::function<std::optional<UserInfoValue>(const ErrorObject&, std::string_view key)>;
  /// Registers `provider` for a domain, replacing the one before; an empty one removes it. Any thread.
  static void setValueProvider(std::string domain, ValueProvider provider);
  /// The provider of a domain; empty when there is none. Any thread.
  static ValueProvider valueProvider(std::string_view domain);

 private:
  std::string domain_;
  int code_;
  UserInfo userInfo_;
  ErrorPointer original_;
};

}  // namespace MarletFoundation
