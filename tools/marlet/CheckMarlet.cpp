#include "CheckMarlet.h"

#include "FatalProblem.h"
#include "MarletFoundation/MarletFoundation.h"

using namespace MarletFoundation;

namespace {

bool failsLike(const Error& error, const FileWrapper& page, const URL& url) {
  try {
    MarletParser::pageSnapshotFromFileWrapper(page, url, std::nullopt);
    return false;
  } catch (const ErrorObject& failure) {
    return failure == ErrorObject(error);
  }
}

/// The page whose load fails with the error, which doesn't say which it was; otherwise the manifest.
std::string fileOf(const Error& error, const Document& document) {
  const auto pages = document.wrapper.child("Pages");
  const auto children = pages ? pages->fileWrappers() : std::nullopt;
  if (children) {
    for (const auto& [name, page] : *children) {
      const auto url = document.url.appendingPathComponent("Pages", true).appendingPathComponent(name, true);
      if (url.pathExtension() == "wbmarletpage" && failsLike(error, page, url)) return "Pages/" + name;
    }
  }
  return std::string(ManifestFilename);
}

}  // namespace

std::vector<Problem> problemsOfMarlet(const Document& document) {
  try {
    const MarletSnapshot mustOpen(document.wrapper, document.url);
    return {};
  } catch (const Error& error) {
    return {problemOfMarletLoad(error, fileOf(error, document))};
  } catch (const FatalProblem& fatal) {
    return {problemOfFatalError(fatal.message)};
  }
}
