#include "MarletFoundation/DiffPack/UserEditsPlace.h"

#include <cerrno>

#include "MarletFoundation/DiffPack/DiffPackSnapshot.h"
#include "MarletFoundation/DiffPack/TreePaths.h"
#include "MarletFoundation/Platform/MoveAside.h"

namespace MarletFoundation {
namespace {

constexpr std::string_view editsName = "Edits";
constexpr std::string_view packName = "UserEdits.diffpack";

FileWrapper::Children children(const FileWrapper& directory, std::initializer_list<std::string_view> names) {
  FileWrapper::Children found;
  for (const auto name : names) {
    if (auto child = directory.child(name)) found.emplace(name, *std::move(child));
  }
  return found;
}

bool canBeRead(const FileWrapper& pack, const URL& bookURL) {
  try {
    DiffPackSnapshot(pack, bookURL.appendingPathComponent("Contents", true));
    return true;
  } catch (const Error&) {
    return false;
  }
}

}  // namespace

std::optional<FileWrapper> userEditsIn(const FileWrapper& book) {
  const auto edits = book.child(editsName);
  return edits ? edits->child(packName) : std::nullopt;
}

void setUserEdits(const FileWrapper& book, FileWrapper pack) {
  pack.setPreferredFilename(std::string(packName));
  addDescendant(book, {editsName, packName}, std::move(pack));
}

FileWrapper withoutUserEdits(const FileWrapper& book) {
  auto parts = children(book, {"Contents", editsName});
  const auto edits = parts.find(editsName);
  // What is no directory stays for the load to complain about.
  if (edits != parts.end() && edits->second.hasChildren()) {
    edits->second = FileWrapper::directory(children(edits->second, {"UserResources", "KeyValueStore.plist"}));
    edits->second.setPreferredFilename(std::string(editsName));
  }
  return FileWrapper::directory(std::move(parts));
}

std::string setUserEditsAside(const URL& bookURL) {
  const auto directory = bookURL.appendingPathComponent(editsName, true);
  const auto pack = userEditsIn(FileWrapper(bookURL));
  if (!pack) throw ErrorObject::posix(ENOENT, directory.appendingPathComponent(packName).path());
  if (canBeRead(*pack, bookURL)) {
    throw diffError(DiffErrorCode::CriticalDiffPackValidationError,
                    "The learner's pack can be read, so it stays. Revert single files instead.");
  }
  return std::string(editsName) + "/" + moveAside(directory, packName);
}

}  // namespace MarletFoundation
