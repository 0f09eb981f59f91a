#pragma once

#include <memory>
#include <string>

#include "MarletFoundation/Platform/Export.h"

namespace MarletFoundation {

/// To whom a language service talks back; between the service and the editor.
class MARLET_EXPORT SourceEditorLanguageServiceDelegate {
 public:
  virtual ~SourceEditorLanguageServiceDelegate() = default;
};

/// What knows a language for one editor. A type of service has a constructor that takes a
/// `std::shared_ptr<SourceEditorLanguageServiceDelegate>`.
class MARLET_EXPORT SourceEditorLanguageService {
 public:
  virtual ~SourceEditorLanguageService() = default;
};

/// A type of service, as a value.
using SourceEditorLanguageServiceClass =
    std::unique_ptr<SourceEditorLanguageService> (*)(std::shared_ptr<SourceEditorLanguageServiceDelegate>);

template <class Service>
std::unique_ptr<SourceEditorLanguageService> sourceEditorLanguageServiceClass(
    std::shared_ptr<SourceEditorLanguageServiceDelegate> delegate) {
  return std::make_unique<Service>(std::move(delegate));
}

/// A language's name and its type of service: `{"Name", sourceEditorLanguageServiceClass<TheService>}`.
struct SourceEditorLanguage {
  std::string name;
  SourceEditorLanguageServiceClass cls;

  /// A new service at each call; the caller owns it.
  std::unique_ptr<SourceEditorLanguageService> makeLanguageService(
      std::shared_ptr<SourceEditorLanguageServiceDelegate> delegate) const {
    return cls(std::move(delegate));
  }
};

}  // namespace MarletFoundation
