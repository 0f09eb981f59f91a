#include "MarletFoundation/DiffPack/DiffPackSnapshot.h"

namespace MarletFoundation {

DiffPackSnapshot::DiffPackSnapshot(DiffPackType type, DiffPackDocumentType document, URL content,
                                   std::string packName, std::string base, std::string update,
                                   FileDiffDescriptors entries)
    : diffPackType(type),
      documentType(document),
      contentUrl(std::move(content)),
      name(std::move(packName)),
      baseVersion(std::move(base)),
      updateVersion(std::move(update)),
      updates(std::move(entries)) {}

std::string DiffPackSnapshot::description() const {
  std::string text(MarletFoundation::description(documentType));
  text.append(" ").append(MarletFoundation::description(diffPackType));
  text.append(", ").append(name).append(" ").append(baseVersion);
  if (updateVersion != baseVersion) text.append(" -> ").append(updateVersion);
  return text;
}

}  // namespace MarletFoundation
