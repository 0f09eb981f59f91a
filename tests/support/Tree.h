#pragma once

#include <filesystem>
#include <map>
#include <ostream>
#include <string>
#include <variant>

#include "MarletFoundation/Data/PropertyListValue.h"
#include "MarletFoundation/Platform/Error.h"
#include "MarletFoundation/Platform/FileWrapper.h"

namespace MarletFoundation::test {

/// A document under test as a literal: paths to contents. A path that ends in "/" is an empty directory, a
/// property-list value is written in XML form.
class Tree {
 public:
  struct Content {
    std::variant<std::string, PropertyListValue> value;

    Content() = default;
    Content(const char* text) : value(std::string(text)) {}
    Content(std::string text) : value(std::move(text)) {}
    Content(PropertyListValue list) : value(std::move(list)) {}
    Content(PropertyListDictionary list) : value(PropertyListValue(std::move(list))) {}
  };

  Tree() = default;
  Tree(std::initializer_list<std::pair<const std::string, Content>> files) : files_(files) {}

  /// With the file, and without any file or directory that stood in its place.
  Tree with(const std::string& path, Content content) const;
  /// Without the file or whole directory.
  Tree without(const std::string& path) const;
  /// With one key of a property-list file set, or taken away.
  Tree withKey(const std::string& path, std::string_view key, PropertyListValue value) const;
  Tree withoutKey(const std::string& path, std::string_view key) const;

  /// The tree in memory.
  FileWrapper wrapper() const;
  void writeTo(const std::filesystem::path& directory) const;

  friend std::ostream& operator<<(std::ostream& out, const Tree& tree);

 private:
  std::map<std::string, Content> files_;
};

/// A directory that lives as long as the object.
class TemporaryDirectory {
 public:
  TemporaryDirectory();
  ~TemporaryDirectory();
  TemporaryDirectory(const TemporaryDirectory&) = delete;
  TemporaryDirectory& operator=(const TemporaryDirectory&) = delete;

  const std::filesystem::path& path() const { return path_; }
  URL url(std::string_view relativePath = {}) const;

 private:
  std::filesystem::path path_;
};

}  // namespace MarletFoundation::test

namespace MarletFoundation {

inline void PrintTo(const PropertyListValue& value, std::ostream* out) { *out << description(value); }
inline void PrintTo(const Error& error, std::ostream* out) { *out << error.description(); }

}  // namespace MarletFoundation
