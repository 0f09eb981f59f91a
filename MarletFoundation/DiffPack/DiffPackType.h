#pragma once

#include <string_view>

#include "MarletFoundation/Platform/Export.h"

namespace MarletFoundation {

/// What a diff pack is for.
enum class DiffPackType {
  /// A new patch release of a book, made by its authors.
  UpdatePack,
  /// What a learner has changed in a book.
  UserEditPack,
};

/// What kind of document a diff pack belongs to.
enum class DiffPackDocumentType { MarletBook };

/// The text that stands for the case in a manifest.
MARLET_EXPORT std::string_view description(DiffPackType type);
MARLET_EXPORT std::string_view description(DiffPackDocumentType type);

}  // namespace MarletFoundation
