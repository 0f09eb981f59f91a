#include "CheckBook.h"

#include <set>

#include "FatalProblem.h"
#include "MarletFoundation/MarletFoundation.h"
#include "MarletFoundation/Platform/Text.h"
#include "PageWarnings.h"
#include "SourceCheck.h"
#include "TreePath.h"

using namespace MarletFoundation;

namespace {

class BookCheck {
 public:
  /// The book opens as authored; its pages do with what can be read of the learner's pack, if there is one.
  BookCheck(const Document& document, std::optional<DiffPackSnapshot> pack)
      : document_(document),
        pack_(std::move(pack)),
        book_(withoutUserEdits(document.wrapper), document.url) {}

  std::vector<Problem> run() && {
    checkImage("book", "Contents", book_.imageReference);
    std::set<std::string> listed;
    for (const auto& chapter : book_.chapters) {
      if (listed.insert(chapter.filename).second) checkChapter(chapter);
    }
    add(sources_.copyDestinations());
    warnOfUnlisted("book.unlistedChapter", "chapter", "Contents/Chapters", listed);
    return std::move(problems_);
  }

 private:
  void checkChapter(const MarletChapterSnapshot& chapter) {
    const auto directory = "Contents/Chapters/" + chapter.filename;
    checkImage("chapter", directory, chapter.imageReference);
    std::set<std::string> listed;
    for (const auto& page : chapter.pages) {
      if (listed.insert(page.filename).second) checkPage(chapter, page, directory + "/Pages");
    }
    warnOfUnlisted("chapter.unlistedPage", "page", directory + "/Pages", listed);
  }

  void checkPage(const MarletChapterSnapshot& chapter, const BookPagePlaceholderSnapshot& placeholder,
                 const std::string& pages) {
    const auto directory = pages + "/" + placeholder.filename;
    try {
      const auto page =
          snapshotForPageWithFilename(placeholder.filename, chapter.filename, document_.url, &book_, pack_);
      add(warningsOfPage(document_.wrapper, directory, *page));
      if (const auto* code = dynamic_cast<const MarletPageSnapshotType*>(page.get()))
        checkSource(directory, *page, *code);
    } catch (const Error& error) {
      problems_.push_back(problemOfPageLoad(error, directory));
      sources_.pass(referencesTo(placeholder.filename, placeholder.name));
    } catch (const FatalProblem& fatal) {
      problems_.push_back(problemOfFatalError(fatal.message));
      sources_.pass(referencesTo(placeholder.filename, placeholder.name));
    }
  }

  /// What sources may call a page: its directory, with or without the extension, or its name.
  static std::vector<std::string> referencesTo(const std::string& filename, const std::string& name) {
    return {filename, filename.substr(0, filename.rfind('.')), name};
  }

  void checkSource(const std::string& directory, const BookPageSnapshotType& page,
                   const MarletPageSnapshotType& code) {
    const auto file = nodeAt(document_.wrapper, directory + "/Contents.swift");
    const auto data = file ? file->regularFileContents() : std::nullopt;
    add(sources_.check(directory, referencesTo(page.filename(), page.name()),
                       data ? utf16FromUTF8(data->view()) : std::nullopt, code.text()));
  }

  void checkImage(const std::string& kind, const std::string& directory,
                  const std::optional<std::string>& reference) {
    add(warningsOfReference(document_.wrapper, directory, kind, "ImageReference", reference));
  }

  void warnOfUnlisted(const std::string& rule, const std::string& noun, const std::string& directory,
                      const std::set<std::string>& listed) {
    const auto node = nodeAt(document_.wrapper, directory);
    const auto children = node ? node->fileWrappers() : std::nullopt;
    if (!children) return;
    for (const auto& [name, child] : *children) {
      if (!child.isDirectory() || name.starts_with('.') || listed.contains(name)) continue;
      problems_.push_back(warning(rule, "No manifest lists this " + noun + ", so no reader meets it.",
                                  directory + "/" + name));
    }
  }

  void add(std::vector<Problem> problems) {
    problems_.insert(problems_.end(), problems.begin(), problems.end());
  }

  const Document& document_;
  std::optional<DiffPackSnapshot> pack_;
  MarletBookSnapshot book_;
  SourceCheck sources_;
  std::vector<Problem> problems_;
};

/// Reads what can be read of the learner's pack, which is not to hide what else is wrong.
std::optional<DiffPackSnapshot> readPack(const Document& document, std::vector<Problem>& problems) {
  const auto directory = userEditsIn(document.wrapper);
  if (!directory) return std::nullopt;
  const auto contents = document.url.appendingPathComponent("Contents", true);
  const auto add = [&](const Error& error, const std::string& suggestion) -> Problem& {
    problems.push_back(problemOfBookLoad(error));
    problems.back().recoverySuggestion = suggestion;
    return problems.back();
  };
  try {
    const PartialDiffPack pack(*directory, contents);
    for (const auto& entry : pack.unreadable) {
      auto& problem = add(*entry.error, "`marlet edit --revert` takes it back.");
      problem.description = entry.filePath + ": " + problem.description;
    }
    return pack.pack;
  } catch (const Error& error) {
    add(error, "`marlet edit --set-aside` puts the pack aside, so that the book opens.");
    return DiffPackSnapshot(DiffPackType::UserEditPack, DiffPackDocumentType::MarletBook, contents, "", "",
                            "", {});
  }
}

}  // namespace

std::vector<Problem> problemsOfBook(const Document& document) {
  std::vector<Problem> problems;
  try {
    auto found = BookCheck(document, readPack(document, problems)).run();
    problems.insert(problems.end(), found.begin(), found.end());
  } catch (const Error& error) {
    problems.push_back(problemOfBookLoad(error));
  } catch (const FatalProblem& fatal) {
    problems.push_back(problemOfFatalError(fatal.message));
  }
  return problems;
}
