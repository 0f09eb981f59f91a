#pragma once

#include <optional>
#include <string_view>

#include "MarletFoundation/Platform/FileWrapper.h"

/// The node at a relative path below `root`, or nothing.
inline std::optional<MarletFoundation::FileWrapper> nodeAt(const MarletFoundation::FileWrapper& root,
                                                           std::string_view path) {
  std::optional node(root);
  while (node && !path.empty()) {
    const auto slash = path.find('/');
    node = node->child(path.substr(0, slash));
    path = slash == std::string_view::npos ? std::string_view() : path.substr(slash + 1);
  }
  return node;
}
