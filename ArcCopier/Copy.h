#pragma once

#include "ArcCopier/ArcCopier.h"
#include "ArcCopier/Destination.h"
#include "ArcCopier/EntryReader.h"
#include "ArcCopier/Plan.h"

namespace ArcCopierImplementation {

/// What ends a copy early.
struct CopyEnd {
  ArcCopierResult result;
  int error;
};

/// One run of a copier over one archive.
class Copy {
 public:
  /// `archive` is open for reading.
  Copy(ArcCopier& copier, int archive);

  /// Throws a `Refusal` before anything was written, or a `CopyEnd`. Gives back the errno of the first file
  /// error or conflict, 0 if there was none.
  int run(const char* destination);

 private:
  void copy(const PlannedItem& item);
  void copyFile(const PlannedItem& item);
  void countBytes(const PlannedItem& item, std::size_t size);
  void failed(const PlannedItem& item, const Problem& problem);
  void failedToWrite(const PlannedItem& item, int error);
  void stopUnlessContinued(int answer);

  ArcCopier& copier_;
  const int archive_;
  ZipDirectory directory_;
  Destination destination_;
  EntryReader reader_;
  std::uint64_t bytes_ = 0;  // of all files so far
  int firstError_ = 0;
};

}  // namespace ArcCopierImplementation
