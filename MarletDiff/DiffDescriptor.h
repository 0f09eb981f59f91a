#pragma once

#include <algorithm>
#include <initializer_list>
#include <memory>
#include <string>
#include <vector>

#include "MarletFoundation/Platform/TextRange.h"

namespace MarletDiff {

/// One change of a text, a hunk: a span of the original and what stands in its place. Ranges count UTF-16
/// units; either may be empty, for an insertion or a removal.
struct DiffDescriptor {
  /// The span replaced, in the original text.
  MarletFoundation::TextRange originalRange;
  /// The span that replaces it, in the modified text.
  MarletFoundation::TextRange modifiedRange;
  std::u16string originalContent;
  std::u16string modifiedContent;

  bool operator==(const DiffDescriptor&) const = default;
};

/// The hunks of one text in order. Immutable; copies share one array, so that any number of files may carry
/// the same hunks at the cost of one.
class DiffDescriptors {
 public:
  DiffDescriptors() = default;
  DiffDescriptors(std::vector<DiffDescriptor> descriptors)
      : descriptors_(std::make_shared<const std::vector<DiffDescriptor>>(std::move(descriptors))) {}
  DiffDescriptors(std::initializer_list<DiffDescriptor> descriptors)
      : DiffDescriptors(std::vector(descriptors)) {}

  const DiffDescriptor* begin() const { return descriptors_ ? descriptors_->data() : nullptr; }
  const DiffDescriptor* end() const { return begin() + size(); }
  std::size_t size() const { return descriptors_ ? descriptors_->size() : 0; }
  bool empty() const { return size() == 0; }
  const DiffDescriptor& operator[](std::size_t index) const { return begin()[index]; }

  bool operator==(const DiffDescriptors& other) const {
    return std::equal(begin(), end(), other.begin(), other.end());
  }

 private:
  std::shared_ptr<const std::vector<DiffDescriptor>> descriptors_;
};

}  // namespace MarletDiff
