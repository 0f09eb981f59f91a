#pragma once

#include <optional>
#include <vector>

#include "ArcCopier/ArcCopier.h"
#include "ArcCopier/Destination.h"
#include "ArcCopier/Plan.h"
#include "ArcCopier/ReadAhead.h"

namespace ArcCopierImplementation {

/// What ends a copy early.
struct CopyEnd {
  ArcCopierResult result;
  int error;
};

/// One run of a copier over one archive.
class Copy {
 public:
  /// Reads the directory of an archive that is open for reading, and throws a `Refusal` if it can't be trusted.
  Copy(ArcCopier& copier, int archive);

  /// Writes. Gives back the errno of the first file error or conflict, 0 if there was none, or throws a
  /// `CopyEnd`.
  int run(const char* destination);

 private:
  void copy(const PlannedItem& item);
  void copyFile(const PlannedItem& item);
  void countBytes(const PlannedItem& item, std::size_t size);
  void failed(const PlannedItem& item, const Problem& problem);
  void failedToWrite(const PlannedItem& item, int error);
  void stopUnlessContinued(int answer);

  ArcCopier& copier_;
  ZipDirectory directory_;
  Destination destination_;
  std::vector<PlannedItem> items_;
  std::optional<ReadAhead> reader_;
  std::uint64_t bytes_ = 0;  // of all files so far
  int firstError_ = 0;
};

}  // namespace ArcCopierImplementation
