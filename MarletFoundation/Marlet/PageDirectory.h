#pragma once

#include <cerrno>
#include <optional>
#include <string>
#include <string_view>

#include "MarletFoundation/Platform/FileManager.h"
#include "MarletFoundation/Platform/FileWrapper.h"

/// What the directories that documents are written as have in common.
namespace MarletFoundation {

/// Adds a reference to what lies at `url` as `name`, and nothing where there is no URL, or nothing at it. What is there
/// and can't be read is a reference all the same: it doesn't show, and ends a write, which would leave it out.
inline void addIfThere(FileWrapper::Children& children, std::string_view name,
                       const std::optional<URL>& url) {
  if (!url || !url->isFileURL()) return;
  try {
    FileManager::resourceIsReachable(*url);
  } catch (const ErrorObject& error) {
    if (error.code() == ENOENT || error.code() == ENOTDIR || error.code() == EINVAL) return;
  }
  children.emplace(name, FileWrapper::reference(*url));
}

}  // namespace MarletFoundation
