#pragma once

#include <optional>
#include <string_view>
#include <vector>

#include "MarletFoundation/Platform/Data.h"
#include "MarletFoundation/Platform/FileWrapper.h"
#include "MarletFoundation/Platform/URL.h"

/// What a path from foreign data names below a directory. Nothing here leaves that directory: a path with
/// ".." names nothing, and no symbolic link is followed below it.
namespace MarletFoundation {

/// The names on the way down; doubled slashes and one at the end add none. Nothing for a path that names
/// nothing below a directory or that no file can have: empty, absolute, with "." or "..", with a NUL, or
/// longer than the system takes.
std::optional<std::vector<std::string_view>> relativePathComponents(std::string_view path);

/// The node at a path below a tree's root, or nothing.
std::optional<FileWrapper> descendant(const FileWrapper& root, std::string_view path);

/// Reads the whole regular file at a path below `directory`. Throws an `ErrorObject` of the POSIX domain,
/// EINVAL for a path that names nothing and for what is no regular file.
Data readDescendant(const URL& directory, std::string_view path);

}  // namespace MarletFoundation
