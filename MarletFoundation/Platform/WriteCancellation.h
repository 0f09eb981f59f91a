#pragma once

#include <string_view>

#include "MarletFoundation/Platform/Export.h"

namespace MarletFoundation {

/// Ends every write of a file or tree that is under way, and each that begins later, with ECANCELED: what it built
/// is removed and nothing is changed. One that has come to its last step is carried out. For a program that is
/// asked to end; may be called from any thread and from a signal handler.
MARLET_EXPORT void cancelWrites() noexcept;
/// Whether a write is under way in this process. May be called from any thread and from a signal handler.
MARLET_EXPORT bool isWriting() noexcept;

/// Throws ECANCELED once writes are cancelled.
void requireNotCancelled(std::string_view path);

/// Counts as a write while it lives.
class WriteUnderWay {
 public:
  WriteUnderWay() noexcept;
  ~WriteUnderWay();
  WriteUnderWay(const WriteUnderWay&) = delete;
  WriteUnderWay& operator=(const WriteUnderWay&) = delete;
};

}  // namespace MarletFoundation
