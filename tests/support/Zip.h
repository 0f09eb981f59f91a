#pragma once

#include <cstdint>
#include <functional>
#include <optional>
#include <string>
#include <vector>

namespace MarletFoundation::test {

/// One entry of an archive under test. What is left out is made to be right; what is set stands in the archive
/// as it is, true or not.
struct ZipItem {
  std::string name;
  std::string contents = {};
  std::uint16_t mode = 0100644;
  std::uint16_t flags = 0;
  std::uint16_t method = 0;
  /// The entry's bytes in the archive, where they aren't the contents.
  std::optional<std::string> packed = {};
  std::optional<std::uint32_t> checksum = {};
  std::optional<std::uint32_t> size = {};
  /// Sizes and offset in a zip64 field.
  bool isZip64 = false;
  /// Overwrites bytes of the local header (30 and the name) or of the directory's entry (46, the name and the
  /// zip64 field).
  std::function<void(std::string& header)> changeLocal = {};
  std::function<void(std::string& header)> changeCentral = {};
};

struct ZipOptions {
  bool isZip64 = false;
  std::string comment = {};
  /// The directory has the entries from the last one to the first.
  bool isBackwards = false;
  /// Overwrites bytes of the end record (22), behind the zip64 records (56 and 20) where there are any.
  std::function<void(std::string& end)> changeEnd = {};
};

std::string zip(const std::vector<ZipItem>& items, const ZipOptions& options = {});

/// So many zero bytes, deflated. Less than 1 in 150.
ZipItem zeros(std::string name, std::size_t size);
/// Archive of about `size` bytes, whose `count` entries lie in each other so that each has all bytes behind it.
std::string overlappingBomb(std::size_t size, std::size_t count);

/// Little endian.
std::string number(std::uint64_t value, std::size_t size);

}  // namespace MarletFoundation::test
