#include "support/Zip.h"

#include <array>

namespace MarletFoundation::test {
namespace {

std::uint32_t crc32(std::string_view bytes) {
  static const auto table = [] {
    std::array<std::uint32_t, 256> values;
    for (std::uint32_t i = 0; i < 256; ++i) {
      values[i] = i;
      for (int bit = 0; bit < 8; ++bit) values[i] = (values[i] & 1 ? 0xEDB88320 : 0) ^ (values[i] >> 1);
    }
    return values;
  }();
  std::uint32_t crc = ~0u;
  for (const char c : bytes) crc = table[(crc ^ static_cast<unsigned char>(c)) & 0xFF] ^ (crc >> 8);
  return ~crc;
}

std::string localHeader(const ZipItem& item, std::uint64_t packedSize) {
  const bool hasDescriptor = item.flags & 8;
  const auto size = [&](std::uint64_t value) {
    return number(hasDescriptor ? 0 : item.isZip64 ? 0xFFFFFFFF : value, 4);
  };
  const auto trueSize = item.size.value_or(item.contents.size());
  auto header = "PK\3\4" + number(20, 2) + number(item.flags, 2) + number(item.method, 2) + number(0, 4) +
                number(hasDescriptor ? 0 : item.checksum.value_or(crc32(item.contents)), 4) +
                size(packedSize) + size(trueSize) + number(item.name.size(), 2) +
                number(item.isZip64 ? 20 : 0, 2) + item.name;
  if (item.isZip64) header += number(1, 2) + number(16, 2) + number(trueSize, 8) + number(packedSize, 8);
  if (item.changeLocal) item.changeLocal(header);
  return header;
}

std::string directoryEntry(const ZipItem& item, std::uint64_t packedSize, std::uint64_t offset) {
  const auto trueSize = item.size.value_or(item.contents.size());
  const auto small = [&](std::uint64_t value) { return number(item.isZip64 ? 0xFFFFFFFF : value, 4); };
  auto header = "PK\1\2" + number(0x031E, 2) + number(20, 2) + number(item.flags, 2) +
                number(item.method, 2) + number(0, 4) +
                number(item.checksum.value_or(crc32(item.contents)), 4) + small(packedSize) +
                small(trueSize) + number(item.name.size(), 2) + number(item.isZip64 ? 28 : 0, 2) +
                number(0, 8) + number(item.mode, 2) + small(offset) + item.name;
  if (item.isZip64)
    header += number(1, 2) + number(24, 2) + number(trueSize, 8) + number(packedSize, 8) + number(offset, 8);
  if (item.changeCentral) item.changeCentral(header);
  return header;
}

std::string endRecords(std::uint64_t count, std::uint64_t size, std::uint64_t offset,
                       const ZipOptions& options) {
  std::string end;
  if (options.isZip64) {
    end = "PK\6\6" + number(44, 8) + number(45, 2) + number(45, 2) + number(0, 8) + number(count, 8) +
          number(count, 8) + number(size, 8) + number(offset, 8);
    end += "PK\6\7" + number(0, 4) + number(offset + size, 8) + number(1, 4);
    count = 0xFFFF;
    size = offset = 0xFFFFFFFF;
  }
  end += "PK\5\6" + number(0, 4) + number(count, 2) + number(count, 2) + number(size, 4) + number(offset, 4) +
         number(options.comment.size(), 2);
  if (options.changeEnd) options.changeEnd(end);
  return end + options.comment;
}

/// A deflate block that holds its bytes as they are.
std::string storedBlock(std::string_view bytes, bool isLast) {
  return std::string(1, isLast) + number(bytes.size(), 2) + number(~bytes.size(), 2) + std::string(bytes);
}

}  // namespace

std::string number(std::uint64_t value, std::size_t size) {
  std::string bytes;
  for (std::size_t i = 0; i < size; ++i) bytes += static_cast<char>(value >> 8 * i);
  return bytes;
}

std::string zip(const std::vector<ZipItem>& items, const ZipOptions& options) {
  std::string archive, directory;
  for (const auto& item : items) {
    const auto& packed = item.packed ? *item.packed : item.contents;
    const auto entry = directoryEntry(item, packed.size(), archive.size());
    directory.insert(options.isBackwards ? 0 : directory.size(), entry);
    archive += localHeader(item, packed.size()) + packed;
    if (item.flags & 8)
      archive += "PK\7\10" + number(crc32(item.contents), 4) + number(packed.size(), 4) +
                 number(item.contents.size(), 4);
  }
  const auto offset = archive.size();
  return archive + directory + endRecords(items.size(), directory.size(), offset, options);
}

ZipItem zeros(std::string name, std::size_t size) {
  std::string packed;
  unsigned bits = 0, count = 0;
  const auto put = [&](unsigned code, unsigned length, bool isHuffman = true) {
    for (unsigned i = 0; i < length; ++i) {
      bits |= (code >> (isHuffman ? length - 1 - i : i) & 1) << count;
      if (++count < 8) continue;
      packed += static_cast<char>(bits);
      bits = count = 0;
    }
  };
  put(3, 3, false);  // the last block, with the fixed codes
  for (std::size_t i = 0; i < 1 + (size - 1) % 258; ++i) put(0b00110000, 8);
  for (std::size_t i = 0; i < (size - 1) / 258; ++i) {
    put(0b11000101, 8);  // 258 bytes like the last one
    put(0, 5);
  }
  put(0, 7);
  put(0, (8 - count) % 8);
  return {
      .name = std::move(name), .contents = std::string(size, '\0'), .method = 8, .packed = std::move(packed)};
}

std::string overlappingBomb(std::size_t size, std::size_t count) {
  std::string kernel;
  std::size_t unpacked = 0;
  while (kernel.size() + 0xFFFF < size) {
    kernel += storedBlock(std::string(0xFFFF, 'x'), false);
    unpacked += 0xFFFF;
  }
  kernel += storedBlock("", true);
  // Each entry quotes the header of the one behind it, and runs on into that one's data.
  std::string headers, directory;
  std::vector<std::pair<ZipItem, std::size_t>> entries;
  std::size_t packed = kernel.size();
  for (std::size_t i = 0; i < count; ++i) {
    ZipItem item{.name = std::to_string(count - i), .method = 8};
    item.size = static_cast<std::uint32_t>(unpacked);
    if (i > 0) {
      const auto quote = storedBlock(headers.substr(0, 30 + entries.back().first.name.size()), false);
      unpacked += quote.size() - 5;
      packed += quote.size();
      item.size = static_cast<std::uint32_t>(unpacked);
      headers = quote.substr(0, 5) + headers;
    }
    headers = localHeader(item, packed) + headers;
    entries.emplace_back(item, packed);
  }
  const auto archive = headers + kernel;
  for (const auto& [item, length] : entries)
    directory += directoryEntry(item, length, archive.size() - length - 30 - item.name.size());
  return archive + directory + endRecords(count, directory.size(), archive.size(), {});
}

}  // namespace MarletFoundation::test
