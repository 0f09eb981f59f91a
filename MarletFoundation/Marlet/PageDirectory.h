#pragma once

#include <optional>
#include <string>
#include <string_view>

#include "MarletFoundation/Platform/FileWrapper.h"

/// What the directories that documents are written as have in common.
namespace MarletFoundation {

/// Adds what lies at `url` as `name`, and nothing where that can't be read or there is no URL.
inline void addIfReadable(FileWrapper::Children& children, std::string_view name,
                          const std::optional<URL>& url) {
  if (!url) return;
  try {
    children.emplace(name, FileWrapper(*url));
  } catch (const Error&) {
  }
}

}  // namespace MarletFoundation
