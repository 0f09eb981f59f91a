#include "MarletFoundation/Data/UserVisibleError.h"

#include "MarletFoundation/Platform/Text.h"

namespace MarletFoundation {

void registerUserVisibleErrorDomain(std::string_view domain) {
  ErrorObject::setValueProvider(
      std::string(domain),
      [](const ErrorObject& object, std::string_view key) -> std::optional<UserInfoValue> {
        const auto* error = dynamic_cast<const UserVisibleError*>(object.original().get());
        if (!error) return std::nullopt;
        const auto contents = error->errorContents();
        if (canonicallyEquivalent(key, LocalizedDescriptionKey)) return contents.localizedDescription;
        if (canonicallyEquivalent(key, LocalizedRecoverySuggestionKey))
          return contents.localizedRecoverySuggestion;
        if (canonicallyEquivalent(key, DebugDescriptionKey)) return error->description();
        return std::nullopt;
      });
}

}  // namespace MarletFoundation
