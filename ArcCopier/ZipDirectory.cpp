#include "ArcCopier/ZipDirectory.h"

#include <sys/stat.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <span>

#include "ArcCopier/ZipFields.h"

namespace ArcCopierImplementation {
namespace {

constexpr std::uint16_t EncryptedFlags = 1u << 0 | 1u << 6 | 1u << 13;
constexpr std::uint16_t DataDescriptorFlag = 1u << 3;
/// The flags that say what an entry's bytes and name mean.
constexpr std::uint16_t MeaningfulFlags = EncryptedFlags | DataDescriptorFlag | 1u << 11;
/// Checksum and both sizes, the least that a data descriptor has.
constexpr std::uint64_t SmallestDescriptor = 12;
/// Local headers of small files lie within a few of these.
constexpr std::size_t WindowSize = 8 << 10;
constexpr std::uint64_t LargestDirectory = std::uint64_t{64} << 20;

[[noreturn]] void refuse(const char* reason, int error = EBADMSG) { throw Refusal{error, reason}; }

/// So many bytes from an offset on, which stay until the next read.
std::string_view readAt(Window& window, std::uint64_t offset, std::size_t size) {
  std::string_view bytes;
  if (const int error = window.read(offset, size, bytes)) refuse("it can't be read", error);
  if (bytes.size() < size) refuse("it is cut off");
  return bytes.substr(0, size);
}

/// Puts the values of a zip64 field in place of those that the record left to it. `values` are the record's
/// in the order in which the field lists them.
void applyZip64(std::string_view extra, std::span<std::uint64_t* const> values) {
  const auto found = zip64Extra(extra);
  if (!found.isWellFormed) refuse("its extra fields are damaged");
  const auto needed = static_cast<std::size_t>(
      std::count_if(values.begin(), values.end(), [](const auto* value) { return *value == In64; }));
  if (!found.field) return;  // the largest number itself, then
  const auto field = *found.field;
  if (needed == 0) {
    // Some writers repeat all values here.
    for (std::size_t i = 0; i < values.size() && (i + 1) * 8 <= field.size(); ++i) {
      if (number64(field, i * 8) != *values[i]) refuse("its zip64 fields contradict the others");
    }
    return;
  }
  if (field.size() != needed * 8) refuse("its zip64 fields contradict the others");
  std::size_t offset = 0;
  for (auto* value : values) {
    if (*value != In64) continue;
    *value = number64(field, offset);
    offset += 8;
  }
}

}  // namespace

bool ZipEntry::isEncrypted() const { return (flags & EncryptedFlags) != 0; }
bool ZipEntry::hasDataDescriptor() const { return (flags & DataDescriptorFlag) != 0; }

/// What the record at the archive's end tells.
struct ZipDirectory::End {
  std::uint64_t position;  // where the end records begin
  std::uint64_t disk, directoryDisk;
  std::uint64_t entriesHere, entries;
  std::uint64_t directorySize, directoryOffset;
};

ZipDirectory::ZipDirectory(int file, std::uint64_t entryLimit)
    : window_(file, WindowSize), directory_(file, 0) {
  struct stat status;
  if (::fstat(file, &status) != 0) refuse("it can't be read", errno);
  if (!S_ISREG(status.st_mode)) refuse("it is no regular file", S_ISDIR(status.st_mode) ? EISDIR : EINVAL);
  archiveSize_ = static_cast<std::uint64_t>(status.st_size);

  const auto end = zip64End(findEnd(file));
  if (end.disk != 0 || end.directoryDisk != 0 || end.entriesHere != end.entries)
    refuse("it is one of several volumes");
  if (end.directoryOffset > end.position || end.directorySize != end.position - end.directoryOffset)
    refuse("its directory doesn't lie where it should, or it is cut off");
  if (end.entries > entryLimit) throw Refusal{EFBIG, "it has too many entries", true};
  if (end.directorySize > LargestDirectory) throw Refusal{EFBIG, "its directory is too large", true};
  if (end.entries > end.directorySize / DirectoryEntrySize)
    refuse("its directory has fewer entries than it says");
  directoryOffset_ = end.directoryOffset;
  readEntries(readAt(directory_, directoryOffset_, static_cast<std::size_t>(end.directorySize)), end.entries);
}

/// The end record is the one whose comment reaches to the end of the file.
ZipDirectory::End ZipDirectory::findEnd(int file) {
  const auto size = static_cast<std::size_t>(std::min<std::uint64_t>(archiveSize_, EndSize + 0xFFFF));
  if (size < EndSize) refuse("it is no zip archive, or cut off");
  Window window(file, size);
  const auto tail = readAt(window, archiveSize_ - size, size);
  std::optional<std::size_t> found;
  for (std::size_t i = size - EndSize + 1; i-- > 0;) {
    if (tail[i] != 'P' || number32(tail, i) != EndSignature) continue;
    if (i + EndSize + number16(tail, i + 20) != size) continue;
    if (found) refuse("it has two ends");
    found = i;
  }
  if (!found) refuse("it is no zip archive, or cut off");
  const auto record = tail.substr(*found);
  return {archiveSize_ - size + *found, number16(record, 4),  number16(record, 6), number16(record, 8),
          number16(record, 10),         number32(record, 12), number32(record, 16)};
}

/// The values of the zip64 end record where there is one.
ZipDirectory::End ZipDirectory::zip64End(const End& end) {
  if (end.position < Zip64LocatorSize + Zip64EndSize) return end;
  const auto locatorPosition = end.position - Zip64LocatorSize;
  auto bytes = readAt(window_, locatorPosition, Zip64LocatorSize);
  if (number32(bytes, 0) != Zip64LocatorSignature) return end;
  const auto position = number64(bytes, 8);
  if (number32(bytes, 4) != 0 || number32(bytes, 16) > 1) refuse("it is one of several volumes");
  if (position > locatorPosition - Zip64EndSize) refuse("its zip64 end doesn't lie where it should");
  bytes = readAt(window_, position, Zip64EndSize);
  if (number32(bytes, 0) != Zip64EndSignature || number64(bytes, 4) != locatorPosition - position - 12)
    refuse("its zip64 end doesn't lie where it should");
  const End large{position,
                  number32(bytes, 16),
                  number32(bytes, 20),
                  number64(bytes, 24),
                  number64(bytes, 32),
                  number64(bytes, 40),
                  number64(bytes, 48)};
  const auto agree = [](std::uint64_t small, std::uint64_t value, std::uint64_t mark) {
    return small == value || small == mark;
  };
  if (!agree(end.disk, large.disk, CountIn64) || !agree(end.directoryDisk, large.directoryDisk, CountIn64) ||
      !agree(end.entriesHere, large.entriesHere, CountIn64) ||
      !agree(end.entries, large.entries, CountIn64) || !agree(end.directorySize, large.directorySize, In64) ||
      !agree(end.directoryOffset, large.directoryOffset, In64)) {
    refuse("its zip64 end contradicts the other");
  }
  return large;
}

void ZipDirectory::readEntries(std::string_view rest, std::uint64_t count) {
  entries_.reserve(static_cast<std::size_t>(count));
  for (std::uint64_t i = 0; i < count; ++i) {
    if (rest.size() < DirectoryEntrySize || number32(rest, 0) != DirectoryEntrySignature)
      refuse("its directory is damaged");
    const std::size_t nameSize = number16(rest, 28), extraSize = number16(rest, 30);
    const auto size = DirectoryEntrySize + nameSize + extraSize + number16(rest, 32);
    if (rest.size() < size) refuse("its directory is damaged");
    if (number16(rest, 34) != 0) refuse("it is one of several volumes");
    ZipEntry entry{.name = rest.substr(DirectoryEntrySize, nameSize),
                   .flags = number16(rest, 8),
                   .method = number16(rest, 10),
                   .checksum = number32(rest, 16),
                   .compressedSize = number32(rest, 20),
                   .size = number32(rest, 24),
                   .headerOffset = number32(rest, 42),
                   .mode = number16(rest, 40)};
    const std::array values{&entry.size, &entry.compressedSize, &entry.headerOffset};
    applyZip64(rest.substr(DirectoryEntrySize + nameSize, extraSize), values);
    entries_.push_back(entry);
    rest.remove_prefix(size);
  }
  if (!rest.empty()) refuse("its directory has more entries than it says");
}

void ZipDirectory::checkLocalHeaders() {
  // As they lie, so that the archive is walked once, in whatever order its directory has them.
  std::vector<ZipEntry*> byOffset;
  byOffset.reserve(entries_.size());
  for (auto& entry : entries_) byOffset.push_back(&entry);
  const auto earlier = [](const ZipEntry* a, const ZipEntry* b) { return a->headerOffset < b->headerOffset; };
  if (!std::is_sorted(byOffset.begin(), byOffset.end(), earlier))
    std::sort(byOffset.begin(), byOffset.end(), earlier);
  std::uint64_t end = 0;
  for (auto* entry : byOffset) {
    if (entry->headerOffset < end) refuse("its entries overlap");
    entry->dataOffset = checkedDataOffset(*entry);
    const auto descriptor = entry->hasDataDescriptor() ? SmallestDescriptor : 0;
    const auto space = directoryOffset_ - entry->dataOffset;
    if (entry->compressedSize > space || descriptor > space - entry->compressedSize)
      refuse("its entries reach into its directory, or it is cut off");
    end = entry->dataOffset + entry->compressedSize + descriptor;
  }
}

std::uint64_t ZipDirectory::checkedDataOffset(const ZipEntry& entry) {
  const auto headSize = LocalHeaderSize + entry.name.size();
  if (entry.headerOffset > directoryOffset_ || headSize > directoryOffset_ - entry.headerOffset)
    refuse("its entries reach into its directory, or it is cut off");
  const auto header = readAt(window_, entry.headerOffset, headSize);
  if (number32(header, 0) != LocalHeaderSignature) refuse("a local header is missing");
  const std::size_t extraSize = number16(header, 28);
  const bool sameMeaning = ((number16(header, 6) ^ entry.flags) & MeaningfulFlags) == 0 &&
                           number16(header, 8) == entry.method && number16(header, 26) == entry.name.size() &&
                           header.substr(LocalHeaderSize) == entry.name;
  if (!sameMeaning) refuse("a local header differs from the directory");
  const auto checksum = number32(header, 14);
  std::uint64_t compressedSize = number32(header, 18);
  std::uint64_t size = number32(header, 22);
  const auto dataOffset = entry.headerOffset + headSize + extraSize;
  if (dataOffset > directoryOffset_) refuse("its entries reach into its directory, or it is cut off");
  if (size == In64 || compressedSize == In64) {
    const auto extra = readAt(window_, entry.headerOffset + headSize, extraSize);
    const std::array values{&size, &compressedSize};
    applyZip64(extra, values);
  }
  // What was not known when the header was written follows the data.
  const auto agrees = [&](std::uint64_t local, std::uint64_t central) {
    return local == central || (entry.hasDataDescriptor() && local == 0);
  };
  if (!agrees(checksum, entry.checksum) || !agrees(compressedSize, entry.compressedSize) ||
      !agrees(size, entry.size)) {
    refuse("a local header differs from the directory");
  }
  return dataOffset;
}

}  // namespace ArcCopierImplementation
