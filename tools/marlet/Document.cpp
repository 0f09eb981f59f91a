#include "Document.h"

using MarletFoundation::FileWrapper;
using MarletFoundation::URL;

namespace {

/// The name decides; without one of the known extensions, what a document of each kind can't do without.
DocumentKind kindOf(const URL& url, const FileWrapper& wrapper) {
  const auto extension = url.pathExtension();
  if (extension == "marletbook" || (extension != "marlet" && wrapper.child("Contents")))
    return DocumentKind::book;
  if (extension == "marlet" || wrapper.child("contents.wbmarlet")) return DocumentKind::classic;
  return DocumentKind::unknown;
}

}  // namespace

Document::Document(const std::string& path_)
    : path(path_), url(URL::file(path_, true).standardized()), wrapper(url), kind(kindOf(url, wrapper)) {}
