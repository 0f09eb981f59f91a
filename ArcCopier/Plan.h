#pragma once

#include <vector>

#include "ArcCopier/EntryPath.h"
#include "ArcCopier/ZipDirectory.h"

namespace ArcCopierImplementation {

/// What is to become of one entry.
struct PlannedItem {
  const ZipEntry* entry;
  /// With what stands against extracting the entry, as far as the directory shows it.
  EntryPath path;
};

/// The entries in the directory's order. Of several for one place the first one has it. Throws a `Refusal` when
/// the entries, and the directories that their paths need besides, are more than allowed.
std::vector<PlannedItem> plan(const ZipDirectory& directory, std::uint64_t entryLimit);

}  // namespace ArcCopierImplementation
