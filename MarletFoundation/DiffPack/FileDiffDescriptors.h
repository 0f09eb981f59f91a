#pragma once

#include <memory>
#include <vector>

#include "MarletDiff/FileDiffDescriptor.h"
#include "MarletFoundation/Platform/Export.h"

namespace MarletFoundation {

/// The entries of a diff pack in order, with a way to look one up by its path. Immutable; copies share one
/// array.
class MARLET_EXPORT FileDiffDescriptors {
 public:
  FileDiffDescriptors(std::vector<MarletDiff::FileDiffDescriptor> entries = {});

  const MarletDiff::FileDiffDescriptor* begin() const { return contents_->entries.data(); }
  const MarletDiff::FileDiffDescriptor* end() const { return begin() + size(); }
  std::size_t size() const { return contents_->entries.size(); }
  bool empty() const { return size() == 0; }
  const MarletDiff::FileDiffDescriptor& operator[](std::size_t index) const {
    return contents_->entries[index];
  }

  /// The first entry of that path, compared byte by byte, or null. Logarithmic in the number of entries.
  const MarletDiff::FileDiffDescriptor* first(std::string_view filePath) const;

 private:
  struct Contents {
    std::vector<MarletDiff::FileDiffDescriptor> entries;
    /// The entries' indexes in the order of their paths; of equal paths the first entry comes first.
    std::vector<std::size_t> byPath;
  };
  std::shared_ptr<const Contents> contents_;
};

}  // namespace MarletFoundation
