#include "MarletFoundation/Platform/DispatchQueueCore.h"

#include "MarletFoundation/Platform/Error.h"
#include "MarletFoundation/Platform/FatalError.h"

namespace MarletFoundation {
namespace {

constexpr std::string_view uncaught = "an asynchronous block ended in an error: ";

}  // namespace

constinit thread_local DispatchQueueCore* DispatchQueueCore::current_ = nullptr;

void DispatchQueueCore::runToEnd(std::function<void()>& block) {
  try {
    block();
  } catch (const Error& error) {
    fatalError(std::string(uncaught) + error.description());
  } catch (const std::exception& error) {
    fatalError(std::string(uncaught) + error.what());
  } catch (...) {
    fatalError(std::string(uncaught) + "unknown");
  }
  block = nullptr;
}

void DispatchQueueCore::setValue(const void* key, std::any value) {
  const std::lock_guard lock(valuesMutex_);
  // The old value is destroyed with the argument, outside of the lock.
  values_[key].swap(value);
}

std::any DispatchQueueCore::value(const void* key) const {
  const std::lock_guard lock(valuesMutex_);
  const auto found = values_.find(key);
  return found == values_.end() ? std::any() : found->second;
}

}  // namespace MarletFoundation
