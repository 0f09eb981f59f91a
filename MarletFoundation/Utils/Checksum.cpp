#include "MarletFoundation/Utils/Checksum.h"

#include <unistd.h>

#include "MarletFoundation/Platform/Digest.h"
#include "MarletFoundation/Platform/FileManager.h"

namespace MarletFoundation {

const ErrorTable& errorTable(ChecksumErrorCase) {
  static constexpr ErrorRow rows[] = {{"InvalidURL"}, {"InputStreamFailure"}};
  static constexpr ErrorTable table{"MarletFoundation.ChecksumError", rows};
  return table;
}

std::string Checksum::MD5ChecksumForFile(const URL& url) {
  const auto contents = FileManager::mapFile(url);
  MD5 digest;
  updateInSlices(digest, contents.view(), static_cast<std::size_t>(::sysconf(_SC_PAGESIZE)));
  return hexadecimal(digest.final());
}

}  // namespace MarletFoundation
