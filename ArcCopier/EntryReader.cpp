#include "ArcCopier/EntryReader.h"

#include <archive.h>

#include <algorithm>
#include <cerrno>
#include <new>

#include "ArcCopier/ZipFields.h"

namespace ArcCopierImplementation {
namespace {

constexpr std::uint16_t Stored = 0;
constexpr std::uint16_t Deflated = 8;
constexpr std::size_t WindowSize = 128 << 10;

char* put(char* place, std::uint64_t value, std::size_t size) {
  for (std::size_t i = 0; i < size; ++i) *place++ = static_cast<char>(value >> 8 * i);
  return place;
}

/// A local header without a name or any of the flags that change how the data is read.
void makeHeader(char* place, const ZipEntry& entry) {
  place = put(place, LocalHeaderSignature, 4);
  place = put(place, 45, 2);  // the version that brought zip64
  place = put(place, 0, 2);
  place = put(place, entry.method, 2);
  place = put(place, 0, 4);
  place = put(place, entry.checksum, 4);
  place = put(place, In64, 4);
  place = put(place, In64, 4);
  place = put(place, 0, 2);
  place = put(place, 20, 2);
  place = put(place, Zip64ExtraTag, 2);
  place = put(place, 16, 2);
  place = put(place, entry.size, 8);
  put(place, entry.compressedSize, 8);
}

}  // namespace

EntryReader::EntryReader(int file) : window_(file, WindowSize) {}

void EntryReader::Close::operator()(archive* reader) const { archive_read_free(reader); }

Problem EntryReader::problem(const ZipEntry& entry) {
  if (entry.isEncrypted()) return {ENOTSUP, "it is encrypted"};
  if (entry.method != Stored && entry.method != Deflated)
    return {ENOTSUP, "it is compressed in a way that is not supported"};
  if (entry.method == Stored && entry.compressedSize != entry.size) return {EBADMSG, "its size is wrong"};
  return {};
}

Problem EntryReader::open(const ZipEntry& entry) {
  // Behind an entry that was not read to its end, libarchive can't go on.
  if (!isAtEnd_) archive_.reset();
  entry_ = entry;
  isHeaderDue_ = true;
  isAtEnd_ = false;
  supplied_ = read_ = 0;
  if (!archive_) {
    archive_.reset(archive_read_new());
    if (!archive_) throw std::bad_alloc();
    archive_read_support_format_zip_streamable(archive_.get());
    if (archive_read_open(archive_.get(), this, nullptr, supply, nullptr) != ARCHIVE_OK) return damage();
  }
  archive_entry* ignored;
  return archive_read_next_header(archive_.get(), &ignored) == ARCHIVE_OK ? Problem() : damage();
}

Problem EntryReader::read(std::string_view& block) {
  const void* bytes = nullptr;
  std::size_t size = 0;
  la_int64_t offset = 0;
  int status = ARCHIVE_OK;
  do {
    status = archive_read_data_block(archive_.get(), &bytes, &size, &offset);
  } while (status == ARCHIVE_OK && size == 0);
  if (status != ARCHIVE_OK && status != ARCHIVE_EOF) return damage();
  isAtEnd_ = status == ARCHIVE_EOF;
  block = isAtEnd_ ? std::string_view() : std::string_view(static_cast<const char*>(bytes), size);
  read_ += block.size();
  const bool isWrong = isAtEnd_ ? read_ != entry_.size : read_ > entry_.size;
  return isWrong ? Problem{EBADMSG, "its size is wrong"} : Problem();
}

Problem EntryReader::damage() const {
  const int error = archive_errno(archive_.get());
  if (error == EIO) return {error, "it can't be read"};
  return {EBADMSG, "its data is damaged"};
}

std::ptrdiff_t EntryReader::supply(archive* reader, void* self, const void** bytes) {
  auto& source = *static_cast<EntryReader*>(self);
  if (source.isHeaderDue_) {
    makeHeader(source.header_.data(), source.entry_);
    source.isHeaderDue_ = false;
    *bytes = source.header_.data();
    return static_cast<std::ptrdiff_t>(source.header_.size());
  }
  const auto rest = source.entry_.compressedSize - source.supplied_;
  if (rest == 0) return 0;
  std::string_view block;
  if (source.window_.read(source.entry_.dataOffset + source.supplied_, 1, block) != 0) {
    archive_set_error(reader, EIO, "the archive can't be read");
    return ARCHIVE_FATAL;
  }
  block = block.substr(0, static_cast<std::size_t>(std::min<std::uint64_t>(block.size(), rest)));
  source.supplied_ += block.size();
  *bytes = block.data();
  return static_cast<std::ptrdiff_t>(block.size());
}

}  // namespace ArcCopierImplementation
