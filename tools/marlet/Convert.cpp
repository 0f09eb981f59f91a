#include "Convert.h"

#include <algorithm>
#include <set>

#include "ConvertedBook.h"
#include "Document.h"
#include "Guarded.h"
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

/// What lies in the document without being part of it, and so isn't carried over: directories that its version has
/// none of, and pages that its list doesn't name.
std::vector<std::string> leftOut(const Document& document, const MarletSnapshot& marlet) {
  std::vector<std::optional<URL>> carried{marlet.sharedSourcesDirectoryURL,
                                          marlet.sharedResourcesDirectoryURL};
  std::set<std::string> filenames;
  for (const auto& page : marlet.pages) {
    carried.insert(carried.end(), {page.sourcesDirectoryURL(), page.resourcesDirectoryURL()});
    filenames.insert(page.filename());
  }
  std::vector<std::string> names;
  for (const auto name : {SourcesDirectoryName, ResourcesDirectoryName}) {
    const auto url = document.url.appendingPathComponent(name, true);
    if (document.wrapper.child(name) && std::find(carried.begin(), carried.end(), url) == carried.end())
      names.emplace_back(name);
  }
  const auto pages = document.wrapper.child("Pages");
  const auto children = pages ? pages->fileWrappers() : std::nullopt;
  if (!children) return names;
  for (const auto& [name, page] : *children) {
    if (page.isDirectory() && !filenames.contains(name)) names.push_back("Pages/" + name);
  }
  return names;
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
    terminal.note(printable("read " + path + ": version " + version + ", " +
                            (manifest.didJoinSections() ? "its sections joined in one page"
                                                        : counted(marlet.pages.size(), "page"))));
    const auto tree = makesBook ? bookOfMarlet(marlet, path, url) : currentForm(marlet, path, url);
    for (const auto& name : leftOut(document, marlet))
      terminal.complain(printable(path + ": left out, since it is no part of the document: " + name));
    writeTree(tree, url, force ? ExistingItem::Replaced : ExistingItem::Kept);
    const std::string form = makesBook ? "a book" : marlet.isSinglePage() ? "version 5.0" : "version 6.0";
    terminal.note(printable("wrote " + output + ": " + form + ", " + counted(marlet.pages.size(), "page")));
    return ExitStatus::good;
  });
}
