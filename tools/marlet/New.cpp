#include "New.h"

#include <algorithm>
#include <filesystem>

#include "Document.h"
#include "ErrorWords.h"
#include "FatalProblem.h"
#include "MarletFoundation/MarletFoundation.h"
#include "MarletFoundation/Platform/Host.h"
#include "MarletFoundation/Platform/Text.h"
#include "NewItems.h"
#include "TreePath.h"

using namespace MarletFoundation;

namespace {

struct Refusal {
  std::string words;
  ExitStatus status;
};

/// Runs `make`, which may throw a refusal, and says how it went.
template <class Make>
ExitStatus making(const std::string& what, const Terminal& terminal, Make make) {
  try {
    make();
    terminal.note("made " + printable(what));
    return ExitStatus::good;
  } catch (const Refusal& refusal) {
    terminal.complain(printable(what + ": " + refusal.words));
    return refusal.status;
  } catch (const Error& error) {
    terminal.complain(printable(what + ": " + wordsWithSuggestion(error)));
  } catch (const FatalProblem& fatal) {
    terminal.complain(printable(what + ": " + fatal.message));
  }
  return ExitStatus::negative;
}

void write(const FileWrapper& tree, const URL& url) {
  try {
    tree.write(url);
  } catch (const Error& error) {
    throw Refusal{wordsOf(error), ExitStatus::failedWrite};
  }
}

/// A name from the command line that is to name a directory.
void requireFilename(const std::string& name) {
  if (name.empty() || name.starts_with('.') || name.find('/') != std::string::npos || !isValidUTF8(name))
    throw Refusal{"This can't be the name of a directory.", ExitStatus::wrongUsage};
}

Document openBook(const std::string& path) {
  try {
    return Document(path);
  } catch (const Error& error) {
    throw Refusal{wordsOf(error), ExitStatus::unreadablePath};
  }
}

void addTo(FileWrapper& parent, const std::string& key, FileWrapper item) {
  auto directory = *parent.child(key);
  if (directory.child(*item.preferredFilename()))
    throw Refusal{"There is something of that name already.", ExitStatus::failedWrite};
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
      throw Refusal{"A book's name ends in \".marletbook\".", ExitStatus::wrongUsage};
    std::error_code unknown;
    if (std::filesystem::symlink_status(url.path(), unknown).type() != std::filesystem::file_type::not_found)
      throw Refusal{"There is something of that name already.", ExitStatus::failedWrite};
    const auto stem = filename.substr(0, filename.rfind('.'));
    write(newBook(filename, name.value_or(stem), identifier ? *identifier : randomUUIDString()), url);
  });
}

ExitStatus makeChapter(const std::string& book, const std::string& name, const Terminal& terminal) {
  return making(book + ": " + name, terminal, [&] {
    requireFilename(name);
    const auto document = openBook(book);
    const MarletBookSnapshot mustOpen(document.wrapper, document.url);
    auto contents = *document.wrapper.child("Contents");
    addTo(contents, "Chapters", newChapter(name, name));
    write(document.wrapper, document.url);
  });
}

ExitStatus makePage(const std::string& book, const std::string& chapter, const std::string& name,
                    bool isCutscene, const Terminal& terminal) {
  return making(book + ": " + chapter + ": " + name, terminal, [&] {
    requireFilename(name);
    const auto document = openBook(book);
    const MarletBookSnapshot snapshot(document.wrapper, document.url);
    const auto isWanted = [&](const MarletChapterSnapshot& c) { return c.filename == chapter; };
    if (std::none_of(snapshot.chapters.begin(), snapshot.chapters.end(), isWanted))
      throw BookPageLoadingError(BookPageLoadingErrorCase::NoSuchChapter, chapter);
    auto directory = *nodeAt(document.wrapper, "Contents/Chapters/" + chapter);
    addTo(
        directory, "Pages",
        isCutscene ? newCutscenePage(name + ".cutscenepage", name) : newCodePage(name + ".marletpage", name));
    write(document.wrapper, document.url);
  });
}
