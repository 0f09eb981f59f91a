#include "MarletFoundation/Marlet/PageHints.h"

#include "MarletFoundation/Marlet/LoadChecks.h"
#include "MarletFoundation/Marlet/MarletBookPageSnapshot.h"
#include "MarletFoundation/Platform/Text.h"
#include "MarletFoundation/Utils/Overloaded.h"

namespace MarletFoundation {
namespace {

using Case = MarletBookPageSnapshot::SerializationErrorCase;
using E = MarletBookPageSnapshot::SerializationError;

MarletHint::ContentType loadContent(const PropertyListDictionary& hint, const FileWrapper& page) {
  if (auto text = optionalString<E>(hint, "Content", Case::HintContentNotAString))
    return MarletHint::Contents{*std::move(text)};
  auto reference = requiredString<E>(hint, "FileReference", Case::HintContentMissing,
                                     Case::HintContentReferenceNotAString);
  const auto resources = page.child("Resources");
  require<E>(resources.has_value(), Case::HintContentReferenceWithoutResources);
  const auto file = fileContents(*resources, reference);
  require<E>(file.has_value(), Case::HintContentReferenceMissingFile);
  require<E>(isValidUTF8(file->view()), Case::InvalidHintContentFile);
  return MarletHint::FileReference{std::string(file->view()), std::move(reference)};
}

MarletHint::PresentationType loadPresentation(const PropertyListDictionary& hint) {
  auto title = optionalString<E>(hint, "SpoilerButtonTitle", Case::HintSpoilerButtonTitleNotAString);
  if (!title) return MarletHint::AlwaysVisible{};
  return MarletHint::HiddenWithSpoilerInstruction{*std::move(title)};
}

}  // namespace

std::vector<MarletHint> loadHints(const PropertyListDictionary& manifest, const FileWrapper& page) {
  std::vector<MarletHint> hints;
  const auto* elements = manifest.find("Hints");
  if (!elements) return hints;
  require<E>(elements->array(), Case::HintsNotAnArray);
  for (const auto& element : *elements->array()) {
    require<E>(element.dictionary(), Case::HintNotADictionary);
    hints.push_back({loadContent(*element.dictionary(), page), loadPresentation(*element.dictionary())});
  }
  return hints;
}

PropertyListValue::Array hintsForManifest(const std::vector<MarletHint>& hints) {
  PropertyListValue::Array array;
  for (const auto& hint : hints) {
    PropertyListDictionary entry;
    std::visit(overloaded{
                   [&](const MarletHint::Contents& inlined) { entry["Content"] = inlined.text; },
                   [&](const MarletHint::FileReference& file) { entry["FileReference"] = file.reference; },
               },
               hint.markupContent);
    if (const auto* hidden = std::get_if<MarletHint::HiddenWithSpoilerInstruction>(&hint.presentationType))
      entry["SpoilerButtonTitle"] = hidden->title;
    array.emplace_back(std::move(entry));
  }
  return array;
}

}  // namespace MarletFoundation
