#pragma once

#include <sys/stat.h>
#include <sys/types.h>

namespace MarletFoundation {

/// Whether a link may be followed by who resolves links on its own, past the kernel and its protection. In a directory
/// that everybody may write to and nobody may clear for others (sticky), anyone can put a link at the name of another
/// one's output; such a link counts only when it is the follower's or the directory owner's. Everywhere else whoever
/// can place a link could as well replace what it leads to.
///
/// `parent` is the descriptor of the directory that holds the link, `link` the link's own status. False, too, when the
/// directory can't be looked at.
bool mayFollowLink(int parent, const struct stat& link);

/// The same rule for a follower of that user number.
inline bool mayFollowLink(const struct stat& directory, const struct stat& link, uid_t follower) {
  constexpr mode_t openToAll = S_ISVTX | S_IWOTH;
  return (directory.st_mode & openToAll) != openToAll || link.st_uid == follower ||
         link.st_uid == directory.st_uid;
}

}  // namespace MarletFoundation
