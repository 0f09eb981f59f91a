#pragma once

#include <memory>
#include <string>

#include "MarletFoundation/SourceEditor/SourceEditorPosition.h"

namespace MarletFoundation {

/// A text that doesn't change. Whoever edits a text makes a new one.
using SharedText = std::shared_ptr<const std::u16string>;

/// A text with lines, as the host's editor keeps it. Converters refer to it without keeping it alive.
class MARLET_EXPORT SourceEditorBuffer {
 public:
  virtual ~SourceEditorBuffer() = default;

  /// The whole text as it is now; never null.
  virtual SharedText text() const = 0;
  /// The position of an offset in UTF-16 units. `lineHint` is a line at which looking may start, and doesn't
  /// change the answer.
  virtual SourceEditorPosition positionFromIndex(std::int64_t index, std::int64_t lineHint) const = 0;
  /// The offset of a position, in UTF-16 units.
  virtual std::int64_t indexFromPosition(const SourceEditorPosition& position) const = 0;
};

}  // namespace MarletFoundation
