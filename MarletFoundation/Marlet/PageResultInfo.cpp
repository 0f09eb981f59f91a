#include "MarletFoundation/Marlet/PageResultInfo.h"

#include "MarletFoundation/DiffPack/MergedUserEdit.h"
#include "MarletFoundation/Logging/Log.h"
#include "MarletFoundation/Marlet/DocumentLog.h"
#include "MarletFoundation/PathUtilities/DocumentPath.h"

namespace MarletFoundation {

std::optional<Data> learnersFile(const DiffPackSnapshot& pack, const URL& pageURL,
                                 std::string_view filename) {
  return mergedUserEdit(pack, documentRelativePath(pageURL, filename, pack.contentUrl));
}

MarletResultInfoSnapshot pageResultInfo(const std::optional<Data>& file) {
  if (!file) return {};
  try {
    return MarletResultInfoSnapshot(*file, MarletResultInfoSnapshot::Format::ResultInfo);
  } catch (const Error& error) {
    Log([&] { return "Failed to load ResultInfo.plist; creating empty result info: " + error.description(); },
        documentLogAspect(), LogLevel::Critical);
    return {};
  }
}

}  // namespace MarletFoundation
