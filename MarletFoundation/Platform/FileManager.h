#pragma once

#include <functional>
#include <optional>

#include "MarletFoundation/Platform/Data.h"
#include "MarletFoundation/Platform/ErrorObject.h"
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
/// True when something can be reached at the URL, links followed; throws what stands against it otherwise.
MARLET_EXPORT bool resourceIsReachable(const URL& url);

/// The names in a directory, sorted by their bytes, hidden ones (leading dot) left out if asked.
MARLET_EXPORT std::vector<std::string> contentsOfDirectory(const URL& url, bool skipHidden);

/// Reads a whole regular file, links followed; pipes and devices are refused (EINVAL) and never opened, and
/// what has more than 1 GiB is, too (EFBIG).
MARLET_EXPORT Data readFile(const URL& url);
/// Replaces or makes the file as a whole: sibling temporary file, flush, rename, flush of the directory. Mode
/// and extended attributes of a replaced file stay; a symbolic link stays and what it points to is replaced.
/// Only regular files are (EISDIR, EINVAL). Leaves nothing behind when it throws.
MARLET_EXPORT void writeFileAtomically(const URL& url, const Data& contents);

/// The bytes of a regular file, mapped instead of read in: for one pass over a file of any size. They are the
/// file's and not a copy: what another process writes shows, and a process that looks at bytes which the file
/// has lost in between is stopped (SIGBUS). Refuses what `readFile` refuses, but for size. What the system makes up
/// as it is read, as in /proc, can't be mapped and is read.
MARLET_EXPORT Data mapFile(const URL& url);

/// Takes a file or whole directory, of any size, from its place at once, and removes it later on the
/// background queue. Throws when it can't be moved away, and then nothing has happened. Until it is removed it
/// lies in the system's temporary directory, as its name, "-" and a unique string, or, where that is on
/// another file system, beside its old place under the same name with a dot in front. `completion` is called
/// on the background queue, with what stood against the removal or nothing.
MARLET_EXPORT void asynchronouslyRemoveItem(
    const URL& url, std::function<void(const std::optional<ErrorObject>&)> completion = {});
/// Removes what writers of the item at `url` that died have left beside it, and nothing that is being built. Each write
/// does so by itself; this is for who means to write and then doesn't. Nothing is thrown.
MARLET_EXPORT void removeAbandonedStages(const URL& url);
/// Removes, on the background queue, what an `asynchronouslyRemoveItem` of the same URL has left beside it because
/// its process ended too soon. Nothing is thrown; `completion` is called for each thing that was found.
MARLET_EXPORT void finishRemovals(const URL& url,
                                  std::function<void(const std::optional<ErrorObject>&)> completion = {});

}  // namespace MarletFoundation::FileManager
