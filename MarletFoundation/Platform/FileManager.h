#pragma once

#include <optional>

#include "MarletFoundation/Platform/Data.h"
#include "MarletFoundation/Platform/URL.h"

/// Questions to the file system and whole-file reads and writes. Failures are thrown as `ErrorObject`s of the
/// POSIX domain that name the path.
namespace MarletFoundation::FileManager {

/// How an item lies to a directory: inside it, the same item, or neither.
enum class Relationship { contains, same, other };

/// The user's documents directory as the host names it (`HostEnvironment`); nothing when there is none.
MARLET_EXPORT std::optional<URL> documentsDirectory();

/// The relationship of `directory` to `item`. Throws when either can't be looked at.
MARLET_EXPORT Relationship relationship(const URL& directory, const URL& item);

MARLET_EXPORT bool fileExists(const URL& url);
/// Whether the URL names a directory, links followed; throws when it can't be told.
MARLET_EXPORT bool isDirectory(const URL& url);
/// Whether the resource can be reached; throws when it can't be told why not, or why not is an error.
MARLET_EXPORT bool resourceIsReachable(const URL& url);

/// The names in a directory, sorted, hidden ones (leading dot) left out if asked.
MARLET_EXPORT std::vector<std::string> contentsOfDirectory(const URL& url, bool skipHidden);

/// Reads a whole regular file; pipes and devices are refused (EINVAL), never waited for.
MARLET_EXPORT Data readFile(const URL& url);
/// Replaces or makes the file as a whole: sibling temporary file, flush, rename, flush of the directory. Mode
/// and extended attributes of a replaced file stay. Leaves nothing behind when it throws.
MARLET_EXPORT void writeFileAtomically(const URL& url, const Data& contents);

}  // namespace MarletFoundation::FileManager
