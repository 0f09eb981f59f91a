#include <sys/mman.h>

#include "MarletFoundation/Platform/Descriptor.h"
#include "MarletFoundation/Platform/FileManager.h"

namespace MarletFoundation::FileManager {
namespace {

Data readInstead(const Descriptor& file, std::optional<off_t> expectedSize, const std::string& path) {
  auto contents = readToEnd(file.get(), expectedSize);
  if (contents.error != 0) throwPosix(contents.error, path);
  return std::move(contents.data);
}

}  // namespace

Data mapFile(const URL& url) {
  const auto path = systemPath(url);
  const Descriptor file(walkingAgain([&] { return ::open(path.c_str(), ReadingFlags); }));
  struct stat status;
  if (!file || ::fstat(file.get(), &status) != 0) throwPosix(errno, path);
  if (!S_ISREG(status.st_mode)) throwNoRegularFile(status, path);
  // Files of the proc kind claim to be empty and aren't.
  if (status.st_size == 0) return readInstead(file, 0, path);
  const auto size = static_cast<std::size_t>(status.st_size);
  void* bytes = ::mmap(nullptr, size, PROT_READ, MAP_SHARED, file.get(), 0);
  if (bytes == MAP_FAILED && errno == ENODEV) return readInstead(file, std::nullopt, path);
  if (bytes == MAP_FAILED) throwPosix(errno, path);
  ::madvise(bytes, size, MADV_SEQUENTIAL);
  const std::shared_ptr<const void> owner(bytes, [size](void* mapped) { ::munmap(mapped, size); });
  return {owner, {static_cast<const std::uint8_t*>(bytes), size}};
}

}  // namespace MarletFoundation::FileManager
