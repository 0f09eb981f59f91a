#pragma once

#include <optional>
#include <string>
#include <variant>

#include "MarletDiff/DiffDescriptor.h"
#include "MarletFoundation/Platform/Data.h"

namespace MarletDiff {

/// How one file differs between two trees. Each case starts with the file's path, relative to the roots of
/// the trees.
struct FileDiffDescriptor {
  struct Added {
    std::string path;
    /// The file's contents; nothing while they are to be found in the modified tree.
    std::optional<MarletFoundation::Data> data = {};
    bool operator==(const Added&) const = default;
  };
  struct Removed {
    std::string path;
    bool operator==(const Removed&) const = default;
  };
  struct Modified {
    std::string path;
    DiffDescriptors diff = {};
    bool operator==(const Modified&) const = default;
  };
  /// A file that is on both sides and is carried whole.
  struct Replaced {
    std::string path;
    std::optional<MarletFoundation::Data> data = {};
    bool operator==(const Replaced&) const = default;
  };

  /// The index of a case is its tag.
  using Change = std::variant<Added, Removed, Modified, Replaced>;
  Change change;

  const std::string& filePath() const {
    return std::visit([](const auto& file) -> const std::string& { return file.path; }, change);
  }
  bool operator==(const FileDiffDescriptor&) const = default;
};

}  // namespace MarletDiff
