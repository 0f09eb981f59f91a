#pragma once

#include <compare>
#include <cstddef>
#include <functional>
#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "MarletFoundation/Platform/Export.h"

namespace MarletFoundation {

/// A resource's place: a file URL, held as its path with a mark for directories, or any other URL, held as
/// its string with an optional base. Paths are raw bytes without percent-encoding, usually UTF-8; only
/// `absoluteString` encodes. Making and joining file URLs never touches the disk.
class MARLET_EXPORT URL {
 public:
  /// The file URL of a path. A relative path is taken from the current directory. A slash at the end marks a
  /// directory, too, and is not part of the path.
  static URL file(std::string_view path, bool isDirectory = false);
  /// Strict RFC 3986: nothing for the empty string, blanks, non-ASCII and anything else that is no URI
  /// reference. A relative reference is kept beside its base; a "file:" URL becomes a file URL.
  static std::optional<URL> parse(std::string_view string, const URL* base = nullptr);

  /// Whether the URL, resolved against its base, is one of a file.
  bool isFileURL() const;
  /// The scheme of the string, or of the base for a relative reference.
  std::optional<std::string> scheme() const;
  /// The decoded path, without a slash at its end but for the root; empty when the URL has none.
  std::string path() const;
  /// The whole URL as a string, percent-encoded, resolved against the base: how a URL prints.
  std::string absoluteString() const;
  /// The string without the base: for a file URL, its absolute string.
  std::string relativeString() const;
  std::optional<URL> baseURL() const;

  /// The last component of the path, percent-decoded; "/" for the root.
  std::string lastPathComponent() const;
  /// What follows the last dot of the last component; empty without one, and for names such as ".hidden".
  std::string pathExtension() const;
  /// The components of the path, "/" first for an absolute one.
  std::vector<std::string> pathComponents() const;

  /// Appends one name or relative path, which may hold any characters; slashes at the seam are not doubled.
  URL appendingPathComponent(std::string_view component, bool isDirectory = false) const;
  URL appendingPathExtension(std::string_view extension) const;
  URL deletingLastPathComponent() const;
  /// Without ".", ".." and doubled slashes, taken from the text alone.
  URL standardized() const;
  /// With the symbolic links of its longest existing leading part resolved.
  URL resolvingSymlinksInPath() const;

  /// The grant that this URL carries (`SecurityScope`), or nothing. It isn't part of what a URL is: URLs are equal
  /// without it, and those made from this one don't have it.
  std::optional<std::string> securityScope() const;
  URL attachingSecurityScope(std::string token) const;

  /// Base included: URLs that resolve alike but are held differently are not equal.
  bool operator==(const URL& other) const;
  std::strong_ordering operator<=>(const URL& other) const;
  std::size_t hash() const;

 private:
  URL(std::string text, bool isFile, bool isDirectory, std::shared_ptr<const URL> base);

  std::string text_;  // the path of a file URL, the string of any other
  bool isFile_ = true;
  bool isDirectory_ = false;
  std::shared_ptr<const URL> base_;
  std::shared_ptr<const std::string> securityScope_;
};

}  // namespace MarletFoundation

template <>
struct std::hash<MarletFoundation::URL> {
  std::size_t operator()(const MarletFoundation::URL& url) const { return url.hash(); }
};
