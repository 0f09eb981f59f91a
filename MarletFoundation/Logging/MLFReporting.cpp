#include "MarletFoundation/Logging/MLFReporting.h"

#include "MarletFoundation/Platform/Host.h"
#include "MarletFoundation/Version/MarletFoundationVersion.h"
#include "TelvaneReporting/Reporter.h"

namespace MarletFoundation {
namespace {

TelvaneReporting::Info sessionInfo() {
  return {{TelvaneReporting::ClientTypeKey, "MarletFoundation"},
          {TelvaneReporting::BatchEventKey, "true"},
          {TelvaneReporting::ClientVersionKey, std::string(MarletFoundationVersionString)},
          {TelvaneReporting::RequireUserInfoKey, "false"},
          {TelvaneReporting::SessionIdentifierKey, randomUUIDString()}};
}

}  // namespace

MLFReporting::MLFReporting()
    : reporter_(std::make_unique<TelvaneReporting::Reporter>(
          sessionInfo(), std::nullopt, TelvaneReporting::Strings{"MarletFoundation"})) {}
MLFReporting::~MLFReporting() = default;

void MLFReporting::startConfiguration(const std::function<void(const std::vector<std::string>&)>& handler) {
  reporter_->startConfiguration(handler);
}
void MLFReporting::flushMessages(const std::function<void(const std::optional<ErrorObject>&)>& completion) {
  reporter_->flushMessages(completion);
}
void MLFReporting::finishSession() { reporter_->finishSession(); }
void MLFReporting::sendMessage(std::uint16_t category, std::uint16_t type,
                               const PropertyListObject& payload) {
  reporter_->sendMessage(category, type, payload);
}

std::string MLFReporting::persistentIdentifierForDNU(const std::string& key) {
  return TelvaneReporting::Reporter::persistentIdentifier(key);
}
std::string MLFReporting::regeneratePersistentIdentifierForDNU(const std::string& key) {
  return TelvaneReporting::Reporter::regeneratePersistentIdentifier(key);
}

}  // namespace MarletFoundation
