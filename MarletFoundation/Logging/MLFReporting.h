#pragma once

#include <cstdint>
#include <functional>
#include <memory>
#include <optional>
#include <string>
#include <vector>

#include "MarletFoundation/Platform/ErrorObject.h"
#include "MarletFoundation/Platform/PropertyListObject.h"

namespace TelvaneReporting {
class Reporter;
}

namespace MarletFoundation {

/// The library's session with the telemetry service, which spools messages to a file and never opens a connection.
/// One thread at a time.
class MARLET_EXPORT MLFReporting {
 public:
  MLFReporting();
  ~MLFReporting();
  MLFReporting(const MLFReporting&) = delete;
  MLFReporting& operator=(const MLFReporting&) = delete;

  /// Begins the session; the handler gets no results when that fails.
  void startConfiguration(
      const std::function<void(const std::vector<std::string>& results)>& completionHandler);
  /// Sends what is queued. `completion` may be empty.
  void flushMessages(const std::function<void(const std::optional<ErrorObject>&)>& completion);
  void finishSession();
  /// Throws an `ErrorObject` when the message can't be taken.
  void sendMessage(std::uint16_t category, std::uint16_t type, const PropertyListObject& payload);

  static std::string persistentIdentifierForDNU(const std::string& key);
  static std::string regeneratePersistentIdentifierForDNU(const std::string& key);

 private:
  const std::unique_ptr<TelvaneReporting::Reporter> reporter_;
};

}  // namespace MarletFoundation
