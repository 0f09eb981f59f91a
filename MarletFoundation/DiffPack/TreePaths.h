#pragma once

#include <string_view>
#include <vector>

#include "MarletFoundation/Platform/FileWrapper.h"

/// Changes of a tree in memory at a path from a pack, given as the names on the way down.
namespace MarletFoundation {

using PathNames = std::vector<std::string_view>;

/// Adds a file or directory where the path says, in place of what is there. Directories are made as needed,
/// also where a file stands in the way. A file that has a preferred file name keeps it. Throws an
/// `ErrorObject` of the POSIX domain (EACCES) for a directory on the way that can't be read: nothing in it
/// may get lost.
void addDescendant(FileWrapper root, const PathNames& path, FileWrapper file);

/// Removes what is at the path, if anything is.
void removeDescendant(FileWrapper root, const PathNames& path);

}  // namespace MarletFoundation
