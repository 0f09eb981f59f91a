#pragma once

#include <cstdint>
#include <optional>
#include <string_view>

/// The layout of zip records; numbers are little endian.
namespace ArcCopierImplementation {

inline constexpr std::uint32_t LocalHeaderSignature = 0x04034B50;
inline constexpr std::uint32_t DirectoryEntrySignature = 0x02014B50;
inline constexpr std::uint32_t EndSignature = 0x06054B50;
inline constexpr std::uint32_t Zip64EndSignature = 0x06064B50;
inline constexpr std::uint32_t Zip64LocatorSignature = 0x07064B50;

inline constexpr std::size_t LocalHeaderSize = 30;
inline constexpr std::size_t DirectoryEntrySize = 46;
inline constexpr std::size_t EndSize = 22;
inline constexpr std::size_t Zip64EndSize = 56;
inline constexpr std::size_t Zip64LocatorSize = 20;

/// A field's value when the true one stands in a zip64 record.
inline constexpr std::uint64_t In64 = 0xFFFFFFFF;
inline constexpr std::uint64_t CountIn64 = 0xFFFF;

inline constexpr std::uint16_t Zip64ExtraTag = 0x0001;

/// `size` bytes from an offset on, which must lie within the bytes.
inline std::uint64_t number(std::string_view bytes, std::size_t offset, std::size_t size) {
  std::uint64_t value = 0;
  for (std::size_t i = size; i-- > 0;) value = value << 8 | static_cast<unsigned char>(bytes[offset + i]);
  return value;
}
inline std::uint16_t number16(std::string_view bytes, std::size_t offset) {
  return static_cast<std::uint16_t>(number(bytes, offset, 2));
}
inline std::uint32_t number32(std::string_view bytes, std::size_t offset) {
  return static_cast<std::uint32_t>(number(bytes, offset, 4));
}
inline std::uint64_t number64(std::string_view bytes, std::size_t offset) { return number(bytes, offset, 8); }

/// The one zip64 field among the extra fields of an entry.
struct Zip64Extra {
  bool isWellFormed;
  std::optional<std::string_view> field;
};

/// Less than a field's head at the end is padding, as some writers put there to align data.
inline Zip64Extra zip64Extra(std::string_view extra) {
  Zip64Extra result{true, std::nullopt};
  while (extra.size() >= 4) {
    const auto tag = number16(extra, 0);
    const std::size_t size = number16(extra, 2);
    if (size > extra.size() - 4 || (tag == Zip64ExtraTag && result.field)) return {false, std::nullopt};
    if (tag == Zip64ExtraTag) result.field = extra.substr(4, size);
    extra.remove_prefix(4 + size);
  }
  return result;
}

}  // namespace ArcCopierImplementation
