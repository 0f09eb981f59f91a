#include "MarletFoundation/Platform/Descriptor.h"

#include <unistd.h>

#include <cstring>
#include <memory>

#include "MarletFoundation/Platform/ErrorObject.h"

namespace MarletFoundation {
namespace {

constexpr std::size_t SmallestBuffer = 4096;

Data shared(std::shared_ptr<std::uint8_t[]> buffer, std::size_t size) {
  const std::span<const std::uint8_t> bytes(buffer.get(), size);
  return {std::shared_ptr<const void>(std::move(buffer)), bytes};
}

/// Reads on behind the `filled` bytes that the buffer holds already.
FileContents readRest(int descriptor, std::shared_ptr<std::uint8_t[]> buffer, std::size_t capacity,
                      std::size_t filled) {
  while (true) {
    if (filled == capacity) {
      if (filled > static_cast<std::size_t>(LargestContents)) return {{}, EFBIG};
      auto larger = std::make_shared_for_overwrite<std::uint8_t[]>(capacity * 2);
      std::memcpy(larger.get(), buffer.get(), filled);
      buffer = std::move(larger);
      capacity *= 2;
    }
    const auto count = retrying([&] {
      return ::pread(descriptor, buffer.get() + filled, capacity - filled, static_cast<off_t>(filled));
    });
    if (count < 0) return {{}, errno};
    if (count == 0) break;
    filled += static_cast<std::size_t>(count);
  }
  if (filled > static_cast<std::size_t>(LargestContents)) return {{}, EFBIG};
  return {shared(std::move(buffer), filled), 0};
}

}  // namespace

Descriptor::~Descriptor() {
  if (number_ >= 0) ::close(number_);
}

FileContents readToEnd(int descriptor, std::optional<off_t> expectedSize) try {
  std::shared_ptr<std::uint8_t[]> buffer;
  std::size_t capacity = 0;
  std::size_t filled = 0;
  if (expectedSize && *expectedSize <= LargestContents) {
    capacity = static_cast<std::size_t>(*expectedSize) + 1;
    buffer = std::make_shared_for_overwrite<std::uint8_t[]>(capacity);
    // At an explicit offset a pipe or socket that took the file's place refuses by itself.
    const auto count = retrying([&] { return ::pread(descriptor, buffer.get(), capacity, 0); });
    if (count == *expectedSize) return {shared(std::move(buffer), static_cast<std::size_t>(count)), 0};
    if (count < 0) return {{}, errno};
    filled = static_cast<std::size_t>(count);
  }
  struct stat status;
  if (::fstat(descriptor, &status) != 0) return {{}, errno};
  if (!S_ISREG(status.st_mode)) return {{}, S_ISDIR(status.st_mode) ? EISDIR : EINVAL};
  if (status.st_size > LargestContents) return {{}, EFBIG};
  if (!buffer) {
    // Files of the proc kind claim to be empty and aren't.
    capacity = std::max(static_cast<std::size_t>(status.st_size) + 1, SmallestBuffer);
    buffer = std::make_shared_for_overwrite<std::uint8_t[]>(capacity);
  }
  return readRest(descriptor, std::move(buffer), capacity, filled);
} catch (const std::bad_alloc&) {
  return {{}, ENOMEM};
}

int writeAll(int descriptor, std::string_view bytes) {
  while (!bytes.empty()) {
    const auto count = retrying([&] { return ::write(descriptor, bytes.data(), bytes.size()); });
    if (count < 0) return -1;
    bytes.remove_prefix(static_cast<std::size_t>(count));
  }
  return 0;
}

int copyBytes(int from, int to) {
  while (true) {
    const auto count =
        retrying([&] { return ::copy_file_range(from, nullptr, to, nullptr, std::size_t{1} << 30, 0); });
    if (count == 0) break;
    if (count < 0 && errno != EXDEV && errno != EINVAL && errno != ENOSYS && errno != EOPNOTSUPP) return -1;
    if (count < 0) break;
  }
  // For file systems that can't, and for files that claim to be empty and aren't.
  std::vector<char> buffer(std::size_t{1} << 16);
  while (true) {
    const auto count = retrying([&] { return ::read(from, buffer.data(), buffer.size()); });
    if (count <= 0) return static_cast<int>(count);
    if (writeAll(to, {buffer.data(), static_cast<std::size_t>(count)}) != 0) return -1;
  }
}

std::optional<std::string> fileSystemPath(const URL& url) {
  auto path = url.path();
  if (!url.isFileURL() || path.empty() || path.find('\0') != std::string::npos) return std::nullopt;
  return path;
}

std::string systemPath(const URL& url) {
  auto path = fileSystemPath(url);
  if (!path) throwPosix(EINVAL, url.path());
  return *std::move(path);
}

void throwPosix(int errorNumber, std::string_view path) { throw ErrorObject::posix(errorNumber, path); }

void throwPosix(int errorNumber, std::string_view path, std::string_view sentence) {
  throw ErrorObject(std::string(PosixErrorDomain), errorNumber,
                    {{std::string(LocalizedDescriptionKey), std::string(sentence)},
                     {std::string(FilePathKey), std::string(path)}});
}

void throwNoRegularFile(const struct stat& status, std::string_view path) {
  if (S_ISDIR(status.st_mode)) throwPosix(EISDIR, path);
  throwPosix(EINVAL, path, "It is no regular file");
}

}  // namespace MarletFoundation
