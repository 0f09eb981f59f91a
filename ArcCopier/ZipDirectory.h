#pragma once

#include <cstdint>
#include <string_view>
#include <vector>

#include "ArcCopier/Window.h"

namespace ArcCopierImplementation {

/// Why an archive is refused as a whole: an errno, and a sentence without a full stop.
struct Refusal {
  int error;
  const char* reason;
  /// Whether it is sound but larger than the limits allow.
  bool isLimit = false;
};

/// One entry as the central directory has it.
struct ZipEntry {
  /// The bytes of the name, in the directory's.
  std::string_view name;
  std::uint16_t flags;
  std::uint16_t method;
  std::uint32_t checksum;
  std::uint64_t compressedSize;
  std::uint64_t size;
  std::uint64_t headerOffset;
  /// Where the compressed bytes begin; known once the local headers were read.
  std::uint64_t dataOffset = 0;
  /// Type and permissions as Unix has them; 0 where the writer knew none.
  std::uint16_t mode;

  bool isEncrypted() const;
  bool hasDataDescriptor() const;
};

/// The central directory of a zip archive, read strictly: where two readers could take an archive for
/// different ones, it is refused.
class ZipDirectory {
 public:
  /// Reads the directory, and throws a `Refusal` if the archive has more entries than allowed, more than one
  /// volume, or a directory that is cut off, doesn't add up, or contradicts itself. Not copied or moved:
  /// entries refer into it.
  ZipDirectory(int file, std::uint64_t entryLimit);
  ZipDirectory(const ZipDirectory&) = delete;
  ZipDirectory& operator=(const ZipDirectory&) = delete;

  /// In the directory's order.
  const std::vector<ZipEntry>& entries() const { return entries_; }
  std::uint64_t archiveSize() const { return archiveSize_; }

  /// Reads the local headers, and throws a `Refusal` unless each says what the directory says and the entries
  /// lie apart from each other and in front of the directory.
  void checkLocalHeaders();

 private:
  struct End;
  End findEnd(int file);
  End zip64End(const End& end);
  void readEntries(std::string_view rest, std::uint64_t count);
  std::uint64_t checkedDataOffset(const ZipEntry& entry);

  Window window_;
  Window directory_;  // holds the whole of it
  std::uint64_t archiveSize_;
  std::uint64_t directoryOffset_;
  std::vector<ZipEntry> entries_;
};

}  // namespace ArcCopierImplementation
