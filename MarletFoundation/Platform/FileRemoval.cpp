#include <stdio.h>

#include <filesystem>

#include "MarletFoundation/Platform/AtomicReplacement.h"
#include "MarletFoundation/Platform/DispatchQueue.h"
#include "MarletFoundation/Platform/FileManager.h"
#include "MarletFoundation/Platform/Host.h"

namespace MarletFoundation::FileManager {
namespace {

using Completion = std::function<void(const std::optional<ErrorObject>&)>;

/// What the name of an item that was moved aside begins with; a UUID ends it.
std::string asidePrefix(const URL& url) { return url.lastPathComponent() + "-"; }

bool isUUID(std::string_view text) {
  return text.size() == 36 && text.find_first_not_of("0123456789ABCDEF-") == std::string_view::npos;
}

/// Moves the item out of the way, and says where to.
std::string moveAside(const URL& url) {
  const auto path = systemPath(url);
  const auto name = asidePrefix(url) + randomUUIDString();
  std::error_code error;
  const auto directory = std::filesystem::temp_directory_path(error);
  auto aside = error ? std::string() : (directory / name).string();
  if (!error && ::rename(path.c_str(), aside.c_str()) == 0) return aside;
  if (!error && errno != EXDEV) throwPosix(errno, path);
  aside = url.deletingLastPathComponent().appendingPathComponent("." + name).path();
  if (::rename(path.c_str(), aside.c_str()) != 0) throwPosix(errno, path);
  return aside;
}

void removeLater(std::string path, Completion completion) {
  DispatchQueue::global(DispatchQuality::background)
      .async([path = std::move(path), completion = std::move(completion)] {
        const int error = removeTree(AT_FDCWD, path);
        if (completion)
          completion(error == 0 ? std::nullopt : std::optional(ErrorObject::posix(error, path)));
      });
}

}  // namespace

void asynchronouslyRemoveItem(const URL& url, Completion completion) {
  removeLater(moveAside(url), std::move(completion));
}

void finishRemovals(const URL& url, Completion completion) {
  const auto directory = url.deletingLastPathComponent();
  std::vector<std::string> names;
  try {
    names = contentsOfDirectory(directory, false);
  } catch (const ErrorObject&) {
    return;  // Where nothing can be listed, nothing could be removed.
  }
  const auto prefix = "." + asidePrefix(url);
  for (const auto& name : names) {
    if (name.starts_with(prefix) && isUUID(std::string_view(name).substr(prefix.size())))
      removeLater(directory.appendingPathComponent(name).path(), completion);
  }
}

}  // namespace MarletFoundation::FileManager
