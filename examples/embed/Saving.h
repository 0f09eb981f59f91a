#pragma once

#include <MarletFoundation/MarletFoundation.h>

#include <cerrno>

/// How an author's host saves a book.
namespace embed {

using namespace MarletFoundation;

inline FileWrapper directoryIn(const FileWrapper& parent, const std::string& name) {
  if (const auto child = parent.child(name)) return *child;
  throw ErrorObject::posix(ENOENT, name);
}

inline void put(FileWrapper directory, const std::string& name, FileWrapper item) {
  item.setPreferredFilename(name);
  directory.addFileWrapper(std::move(item));
}

/// Manifests of books and chapters are XML, so that an update can carry them as text.
inline void putManifest(const FileWrapper& directory, const PropertyListValue& manifest) {
  put(directory, "Manifest.plist",
      FileWrapper::regularFile(PropertyListSerialization::write(manifest, PropertyListFormat::xml)));
}

/// An emptied store has no file.
inline void putStore(FileWrapper book, const MarletKeyValueStoreSnapshot& store) {
  if (!book.child("Edits")) {
    if (!store.needsSerialization()) return;
    put(book, "Edits", FileWrapper::directory());
  }
  auto edits = directoryIn(book, "Edits");
  if (store.needsSerialization()) {
    put(edits, "KeyValueStore.plist", FileWrapper::regularFile(store.plistData()));
  } else {
    edits.removeFileWrapper("KeyValueStore.plist");
  }
}

/// Puts a page's directory, all manifests and the store into the tree that lies on disk, and writes that: the
/// new tree takes the old one's place at once, so that a crash leaves the one or the other, and shares with it
/// the files that nobody touched.
///
/// The page must have been loaded without a learner's pack. What a learner changes is saved as a pack in
/// "Edits" and never goes into "Contents". Throws what making and writing of file wrappers throws.
inline void save(const MarletBookSnapshot& book, const std::string& chapterFilename,
                 const BookPageSnapshotType& page, const URL& bookURL) {
  const FileWrapper root(bookURL);
  const auto contents = directoryIn(root, "Contents");
  const auto chapters = directoryIn(contents, "Chapters");
  putManifest(contents, book.manifest());
  for (const auto& chapter : book.chapters)
    putManifest(directoryIn(chapters, chapter.filename), chapter.manifest());
  put(directoryIn(directoryIn(chapters, chapterFilename), "Pages"), page.filename(), page.fileWrapper());
  putStore(root, book.keyValueStore);
  root.write(bookURL);
}

}  // namespace embed
