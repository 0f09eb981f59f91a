#pragma once

#include <string>
#include <variant>

#include "MarletFoundation/Platform/Export.h"

namespace MarletFoundation {

/// A short piece of help that a page offers, in marked-up text.
struct MARLET_EXPORT MarletHint {
  /// Text that stands in the page's manifest.
  struct Contents {
    std::string text;
    bool operator==(const Contents&) const = default;
  };
  /// Text of a file directly inside the page's resources.
  struct FileReference {
    std::string contents;
    /// The file's name.
    std::string reference;
    bool operator==(const FileReference&) const = default;
  };
  struct ContentType : std::variant<Contents, FileReference> {
    using variant::variant;
    const std::string& text() const {
      if (const auto* file = std::get_if<FileReference>(this)) return file->contents;
      return std::get<Contents>(*this).text;
    }
  };

  /// Hidden behind a button; the title may be empty.
  struct HiddenWithSpoilerInstruction {
    std::string title;
    bool operator==(const HiddenWithSpoilerInstruction&) const = default;
  };
  struct AlwaysVisible {
    bool operator==(const AlwaysVisible&) const = default;
  };
  using PresentationType = std::variant<HiddenWithSpoilerInstruction, AlwaysVisible>;

  ContentType markupContent;
  PresentationType presentationType;

  bool operator==(const MarletHint&) const = default;
};

}  // namespace MarletFoundation
