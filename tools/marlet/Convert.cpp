#include "Convert.h"

#include <algorithm>

#include "ConvertedBook.h"
#include "Document.h"
#include "Guarded.h"
#include "LeftOut.h"
#include "MarletFoundation/MarletFoundation.h"
#include "Writing.h"

using namespace MarletFoundation;

namespace {

[[noreturn]] void refuse(const std::string& path, const std::string& reason) {
  throw CommandFailure{ExitStatus::negative, path + ": " + reason};
}

/// Writing leaves out what can't be read; whoever converts a document expects all of it.
void requireReadable(const MarletSnapshot& marlet) {
  const auto require = [](const std::optional<URL>& url) {
    if (url) orFailWith(ExitStatus::unreadablePath, url->path(), [&] { FileWrapper readable(*url); });
  };
  require(marlet.marletIconURL);
  require(marlet.sharedSourcesDirectoryURL);
  require(marlet.sharedResourcesDirectoryURL);
  for (const auto& page : marlet.pages) {
    require(page.sourcesDirectoryURL());
    require(page.resourcesDirectoryURL());
  }
}

FileWrapper currentForm(const MarletSnapshot& marlet, const std::string& path, const URL& url) {
  const auto isUnnamed = [](const MarletPageSnapshot& page) { return !page.name(); };
  if (!marlet.isSinglePage() && std::any_of(marlet.pages.begin(), marlet.pages.end(), isUnnamed))
    refuse(path, "Its page has no name, but where sources or resources are shared every page needs one.");
  auto tree = marlet.fileWrapper();
  const MarletSnapshot mustOpen(tree, url);
  return tree;
}

/// Replacing a document by itself in another form must keep all that lies in it, and replacing what it lies in nothing.
void requireNothingLost(const Document& document, const std::vector<std::string>& leftOut,
                        const URL& output) {
  if (!FileManager::fileExists(output)) return;
  const auto relationship = orFailWith(ExitStatus::unreadablePath, document.path,
                                       [&] { return FileManager::relationship(output, document.url); });
  if (relationship == FileManager::Relationship::contains)
    refuse(document.path, "It lies in what would be replaced: " + output.path());
  if (relationship == FileManager::Relationship::other || leftOut.empty()) return;
  std::string names;
  for (const auto& name : leftOut) names += (names.empty() ? "" : ", ") + name;
  refuse(document.path,
         "What isn't part of the document would be lost: " + names + ". Convert it under another name.");
}

std::string counted(std::size_t number, const std::string& noun) {
  return std::to_string(number) + " " + noun + (number == 1 ? "" : "s");
}

}  // namespace

ExitStatus convert(const std::string& path, const std::string& output, bool force, const Terminal& terminal) {
  return guarded(path, terminal, [&] {
    const auto url = URL::file(output, true).standardized();
    const bool makesBook = url.pathExtension() == "marletbook";
    if (!makesBook && url.pathExtension() != "marlet")
      throw CommandFailure{ExitStatus::wrongUsage,
                           output + ": The name to write must end in \".marlet\" or \".marletbook\"."};
    const auto document = orFailWith(ExitStatus::unreadablePath, path, [&] { return Document(path); });
    if (document.kind != DocumentKind::classic) refuse(path, "This is no classic document.");
    if (!force) requireNothingAt(output);

    const MarletSnapshot marlet(document.wrapper, document.url);
    requireReadable(marlet);
    MarletParser manifest(document.wrapper, document.url);
    manifest.parse();
    const auto version =
        std::to_string(manifest.majorVersion()) + "." + std::to_string(manifest.minorVersion());
    terminal.note("read " + path + ": version " + version + ", " +
                  (manifest.didJoinSections() ? "its sections joined in one page"
                                              : counted(marlet.pages.size(), "page")));
    const auto tree = makesBook ? bookOfMarlet(marlet, path, url) : currentForm(marlet, path, url);
    const auto others = leftOut(document, marlet);
    requireNothingLost(document, others, url);
    for (const auto& name : others)
      terminal.complain(path + ": left out, since it is no part of the document: " + name);
    const std::string form = makesBook ? "a book" : marlet.isSinglePage() ? "version 5.0" : "version 6.0";
    const auto done = "wrote " + output + ": " + form + ", " + counted(marlet.pages.size(), "page");
    writeTree(tree, url, force ? ExistingItem::Replaced : ExistingItem::Kept);
    terminal.note(done);
    return ExitStatus::good;
  });
}
