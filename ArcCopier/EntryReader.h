#pragma once

#include <array>
#include <cstdint>
#include <memory>
#include <string_view>

#include "ArcCopier/EntryPath.h"
#include "ArcCopier/Window.h"
#include "ArcCopier/ZipDirectory.h"

struct archive;

namespace ArcCopierImplementation {

/// Decompresses entries. libarchive sees none of the archive's own headers: for each entry it is given a
/// header made from the checked directory, and the entry's bytes behind that.
class EntryReader {
 public:
  explicit EntryReader(int file);
  EntryReader(const EntryReader&) = delete;
  EntryReader& operator=(const EntryReader&) = delete;

  /// What stands against reading the entry at all: encryption, or a compression that isn't read here.
  static Problem problem(const ZipEntry& entry);

  /// Goes to an entry. The one before may have been read in part or failed.
  Problem open(const ZipEntry& entry);
  /// The next bytes, which stay until the next call; empty at the end, which is only reached when size and
  /// checksum are right.
  Problem read(std::string_view& block);

 private:
  struct Close {
    void operator()(archive* reader) const;
  };
  /// libarchive's call for the next bytes of the source.
  static std::ptrdiff_t supply(archive* reader, void* self, const void** bytes);
  Problem damage() const;

  /// A local header with its zip64 field.
  static constexpr std::size_t HeaderSize = 30 + 20;

  Window window_;
  std::array<char, HeaderSize> header_;
  std::unique_ptr<archive, Close> archive_;
  ZipEntry entry_{};
  bool isHeaderDue_ = false;
  bool isAtEnd_ = true;
  std::uint64_t supplied_ = 0;  // compressed bytes given to libarchive
  std::uint64_t read_ = 0;      // bytes that came out
};

}  // namespace ArcCopierImplementation
