#include "New.h"

#include <algorithm>

#include "Document.h"
#include "Ending.h"
#include "Guarded.h"
#include "MarletFoundation/MarletFoundation.h"
#include "MarletFoundation/Platform/Host.h"
#include "NewItems.h"
#include "TreePath.h"
#include "Writing.h"

using namespace MarletFoundation;

namespace {

/// Runs `make` and says what was made.
template <class Make>
ExitStatus making(const std::string& what, const Terminal& terminal, Make make) {
  return guarded(what, terminal, [&] {
    const auto done = "made " + what;
    make();
    terminal.note(done);
    return ExitStatus::good;
  });
}

/// Opens a book, which must load, lets `change` change its tree, and writes that.
template <class Change>
void changing(const std::string& path, Change change) {
  const auto open = [&] {
    return orFailWith(ExitStatus::unreadablePath, path, [&] { return Document(path); });
  };
  committing(path, [&] {
    return readOneState(path, open, [&](const Document& document) {
      change(document, MarletBookSnapshot(document.wrapper, document.url));
      writeTree(document.wrapper, document.url, ExistingItem::Replaced);
      return true;
    });
  });
}

void addTo(FileWrapper& parent, const std::string& key, FileWrapper item) {
  auto directory = *parent.child(key);
  if (directory.child(*item.preferredFilename())) refuseToOverwrite(*item.preferredFilename());
  addListed(parent, key, directory, std::move(item));
}

}  // namespace

ExitStatus makeBook(const std::string& path, const std::optional<std::string>& name,
                    const std::optional<std::string>& identifier, const Terminal& terminal) {
  return making(path, terminal, [&] {
    const auto url = URL::file(path, true).standardized();
    const auto filename = url.lastPathComponent();
    requireFilename(filename);
    if (url.pathExtension() != "marletbook")
      throw CommandFailure{ExitStatus::wrongUsage, path + ": A book's name ends in \".marletbook\"."};
    requireNothingAt(path);
    const auto stem = filename.substr(0, filename.rfind('.'));
    writeTree(newBook(filename, name.value_or(stem), identifier ? *identifier : randomUUIDString()), url,
              ExistingItem::Kept);
  });
}

ExitStatus makeChapter(const std::string& book, const std::string& name, const Terminal& terminal) {
  return making(book + ": " + name, terminal, [&] {
    requireFilename(name);
    changing(book, [&](const Document& document, const MarletBookSnapshot&) {
      auto contents = *document.wrapper.child("Contents");
      addTo(contents, "Chapters", newChapter(name, name));
    });
  });
}

ExitStatus makePage(const std::string& book, const std::string& chapter, const std::string& name,
                    bool isCutscene, const Terminal& terminal) {
  return making(book + ": " + chapter + ": " + name, terminal, [&] {
    requireFilename(name);
    changing(book, [&](const Document& document, const MarletBookSnapshot& snapshot) {
      const auto isWanted = [&](const MarletChapterSnapshot& c) { return c.filename == chapter; };
      if (std::none_of(snapshot.chapters.begin(), snapshot.chapters.end(), isWanted))
        throw BookPageLoadingError(BookPageLoadingErrorCase::NoSuchChapter, chapter);
      auto directory = *nodeAt(document.wrapper, "Contents/Chapters/" + chapter);
      addTo(directory, "Pages",
            isCutscene ? newCutscenePage(name + ".cutscenepage", name)
                       : newCodePage(name + ".marletpage", name));
    });
  });
}
