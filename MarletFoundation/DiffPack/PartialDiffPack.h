#pragma once

#include <string_view>
#include <vector>

#include "MarletFoundation/DiffPack/DiffPackSnapshot.h"

namespace MarletFoundation {

/// A pack as far as it can be read.
struct MARLET_EXPORT PartialDiffPack {
  /// An entry whose file or changes can't be read.
  struct Unreadable {
    std::string filePath;
    /// "Added", "Replaced" or "Modified".
    std::string_view section;
    ErrorPointer error;
  };

  std::vector<Unreadable> unreadable;
  /// The rest.
  DiffPackSnapshot pack;

  /// Reads what can be read. Throws as `DiffPackSnapshot` where it can't be told what the pack holds: its manifest is
  /// missing or no manifest, or an entry names no file.
  PartialDiffPack(const FileWrapper& fileWrapper, URL contentUrl);
};

}  // namespace MarletFoundation
