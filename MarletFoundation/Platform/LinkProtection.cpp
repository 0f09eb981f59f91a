#include "MarletFoundation/Platform/LinkProtection.h"

#include <unistd.h>

namespace MarletFoundation {

bool mayFollowLink(int parent, const struct stat& link) {
  struct stat directory;
  return ::fstat(parent, &directory) == 0 && mayFollowLink(directory, link, ::geteuid());
}

}  // namespace MarletFoundation
