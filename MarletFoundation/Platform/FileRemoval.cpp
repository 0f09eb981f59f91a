#include <stdio.h>

#include <filesystem>

#include "MarletFoundation/Platform/AtomicReplacement.h"
#include "MarletFoundation/Platform/DispatchQueue.h"
#include "MarletFoundation/Platform/FileManager.h"
#include "MarletFoundation/Platform/Host.h"

namespace MarletFoundation::FileManager {
namespace {

/// Moves the item out of the way, and says where to.
std::string moveAside(const URL& url) {
  const auto path = systemPath(url);
  const auto name = url.lastPathComponent() + "-" + randomUUIDString();
  std::error_code error;
  const auto directory = std::filesystem::temp_directory_path(error);
  auto aside = error ? std::string() : (directory / name).string();
  if (!error && ::rename(path.c_str(), aside.c_str()) == 0) return aside;
  if (!error && errno != EXDEV) throwPosix(errno, path);
  aside = url.deletingLastPathComponent().appendingPathComponent("." + name).path();
  if (::rename(path.c_str(), aside.c_str()) != 0) throwPosix(errno, path);
  return aside;
}

}  // namespace

void asynchronouslyRemoveItem(const URL& url,
                              std::function<void(const std::optional<ErrorObject>&)> completion) {
  DispatchQueue::global(DispatchQuality::background)
      .async([path = moveAside(url), completion = std::move(completion)] {
        const int error = removeTree(AT_FDCWD, path);
        if (completion)
          completion(error == 0 ? std::nullopt : std::optional(ErrorObject::posix(error, path)));
      });
}

}  // namespace MarletFoundation::FileManager
