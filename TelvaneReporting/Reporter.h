#pragma once

#include <cstdint>
#include <functional>
#include <map>
#include <optional>
#include <string>
#include <vector>

#include "MarletFoundation/Platform/ErrorObject.h"
#include "MarletFoundation/Platform/PropertyListObject.h"

/// A telemetry client that never opens a connection: messages are spooled to a file in the application-support
/// directory, from where whoever runs the machine may collect them, or not.
namespace TelvaneReporting {

/// The keys of a session's info.
inline constexpr const char* ClientTypeKey = "clientType";
inline constexpr const char* BatchEventKey = "batchEvent";
inline constexpr const char* ClientVersionKey = "clientVersion";
inline constexpr const char* RequireUserInfoKey = "requireUserInfo";
inline constexpr const char* SessionIdentifierKey = "sessionIdentifier";

using Info = std::map<std::string, std::string>;
using Strings = std::vector<std::string>;

/// A session. One thread at a time; several processes may spool to one file. It is never waited for another process that
/// holds the spool's lock for long, nor for what isn't a file in the spool's place: messages fail then.
class Reporter {
 public:
  /// In bytes. A spool that would grow beyond it becomes "Messages.old.jsonl", in the place of any former one.
  static constexpr std::size_t SpoolLimit = 1 << 20;

  Reporter(Info sessionInfo, std::optional<Info> userInfo, Strings frameworksToCheck);

  /// Begins the session. The handler gets one result for each thing that was set up, and none when messages can't
  /// be spooled. It is called before this returns.
  void startConfiguration(const std::function<void(const Strings& results)>& handler);
  /// Spools one message as a line of JSON. Throws an `ErrorObject` when the payload has no form in JSON, no session
  /// was begun, or the file can't be written; nothing is half written then.
  void sendMessage(std::uint16_t category, std::uint16_t type,
                   const MarletFoundation::PropertyListObject& payload);
  /// Has what was spooled written to disk, and calls `completion` with what stood against it or nothing.
  void flushMessages(
      const std::function<void(const std::optional<MarletFoundation::ErrorObject>&)>& completion);
  void finishSession();

  /// An identifier that stays the same for the key and this user; a new one where it can't be kept.
  static std::string persistentIdentifier(const std::string& key);
  /// Gives the key a new one.
  static std::string regeneratePersistentIdentifier(const std::string& key);

 private:
  Info sessionInfo_;
  std::optional<Info> userInfo_;
  Strings frameworksToCheck_;
  bool isOpen_ = false;
};

}  // namespace TelvaneReporting
