#include "ApplyCommand.h"

#include <iostream>

#include "Book.h"
#include "Ending.h"
#include "Hunks.h"
#include "JSON.h"
#include "UpdatePreview.h"

using namespace MarletFoundation;
using nlohmann::ordered_json;

namespace {

/// The application of one pack to one book.
class Application {
 public:
  Application(const std::string& path, const DiffPackSnapshot& update, const ApplyOptions& options,
              const Terminal& terminal)
      : path_(path), update_(update), options_(options), terminal_(terminal) {}

  ExitStatus run() {
    auto status = ExitStatus::good;
    try {
      committing(path_, [&] { attempt(); });
    } catch (const CommandFailure& failure) {
      status = failure.status;
      error_ = failure.sentence;
    } catch (const Error& error) {
      status = ExitStatus::negative;
      error_ = path_ + ": " + wordsWithSuggestion(error);
    }
    if (options_.asJSON) {
      printJSON();
    } else {
      print();
    }
    if (error_) terminal_.complain(printable(*error_));
    return status;
  }

 private:
  /// Opens the book, applies the update in memory, looks at what came of it, and writes it. May run again.
  void attempt() {
    const auto url = withBook(path_, [&](const Book& book) {
      requireBookDocument(book.document.url);
      if (!options_.force) requireMeantFor(book.snapshot);
      preview_.emplace(book, update_);
      return book.document.url;
    });
    if (preview_->hasConflict()) {
      throw CommandFailure{
          ExitStatus::negative,
          path_ + ": the update and the learner's edits change the same text. Nothing was changed."};
    }
    const auto merged = mergedBook(url);
    preview_->take(merged.conflicts);
    // No flag waives this: it is about the learner's work, and not about what the update is meant for.
    if (!merged.conflicts.empty())
      throw CommandFailure{ExitStatus::negative, path_ + ": " + description(merged.conflicts)};
    if (options_.isDryRun) return;
    if (options_.backup) backUp(url);
    commit(path_, [&] { merged.document.write(url); });
    isApplied_ = true;
  }

  /// The library applies what it is given; whether that is meant for this book is for us to ask.
  void requireMeantFor(const MarletBookSnapshot& book) const {
    const auto refuse = [&](const std::string& reason) {
      throw CommandFailure{ExitStatus::negative,
                           path_ + ": " + reason + " Apply it all the same with --force."};
    };
    if (update_.diffPackType != DiffPackType::UpdatePack) refuse("the pack is no update.");
    if (update_.name != book.contentIdentifier) {
      refuse("the pack is for " + update_.name + ", and the book is " + book.contentIdentifier + ".");
    }
    const auto version = book.contentVersion.versionString();
    if (update_.baseVersion != version)
      refuse("the pack is for version " + update_.baseVersion + ", and the book has " + version + ".");
  }

  CheckedUpdate mergedBook(const URL& url) const {
    try {
      return checkedUpdate(url, update_);
    } catch (const ErrorObject& error) {
      if (error.domain() != PosixErrorDomain || error.code() != ESTALE) throw;
      throw ChangedMeanwhile{{ExitStatus::failedWrite, path_ + ": " + wordsWithSuggestion(error)}};
    }
  }

  /// A copy that an earlier attempt made gives way to one of the book as it is now.
  void backUp(const URL& url) {
    const auto copy = URL::file(*options_.backup, true).appendingPathComponent(url.lastPathComponent(), true);
    if (!isBackedUp_ && FileManager::fileExists(copy)) {
      throw CommandFailure{ExitStatus::failedWrite,
                           copy.path() + ": there is something already. Nothing was changed."};
    }
    orFailWith(ExitStatus::failedWrite, copy.path(), [&] { FileWrapper(url).write(copy); });
    isBackedUp_ = true;
  }

  void printJSON() const {
    auto files = ordered_json::array(), edits = ordered_json::array(), conflicts = ordered_json::array();
    if (preview_) {
      for (const auto& file : preview_->files) files.push_back(json(file));
      for (const auto& edit : preview_->edits) edits.push_back(json(edit));
      for (const auto& conflict : preview_->conflicts) conflicts.push_back(json(conflict));
    }
    std::cout << dumped({{"applied", isApplied_},
                         {"baseVersion", update_.baseVersion},
                         {"updateVersion", update_.updateVersion},
                         {"files", std::move(files)},
                         {"edits", std::move(edits)},
                         {"conflicts", std::move(conflicts)},
                         {"error", error_ ? ordered_json(*error_) : ordered_json(nullptr)}})
              << "\n";
  }

  void print() const {
    using Style = Terminal::Style;
    if (preview_) {
      for (const auto& file : preview_->files) {
        if (file.isLeftInPlace) std::cout << "Left in place: " << printable(file.file) << "\n";
      }
      for (const auto& edit : preview_->edits) {
        std::cout << "Edit of " << printable(edit.file) << ": " << stateName(edit.state) << "\n";
        if (!edit.conflict) continue;
        std::cout << "line " << edit.conflict->line << " reads:\n";
        printMarked(' ', edit.conflict->base, Style::dim, terminal_);
        std::cout << "the learner wrote:\n";
        printMarked('-', edit.conflict->learner, Style::red, terminal_);
        std::cout << "the update has:\n";
        printMarked('+', edit.conflict->update, Style::green, terminal_);
      }
      for (const auto& conflict : preview_->conflicts)
        std::cout << "Conflict at " << printable(conflict.file) << ": " << printable(wordsOf(conflict))
                  << "\n";
    }
    if (error_) return;
    std::cout << (options_.isDryRun ? "Would be applied: " : "Applied: ") << printable(update_.description())
              << ", " << counted(update_.updates.size(), "file") << "\n";
  }

  const std::string& path_;
  const DiffPackSnapshot& update_;
  const ApplyOptions& options_;
  const Terminal& terminal_;
  std::optional<UpdatePreview> preview_;
  bool isApplied_ = false, isBackedUp_ = false;
  std::optional<std::string> error_;
};

}  // namespace

ExitStatus apply(const std::string& book, const std::string& pack, const ApplyOptions& options,
                 const Terminal& terminal) {
  return guarded(pack, terminal, [&] {
    const auto url = URL::file(pack, true).standardized();
    const auto wrapper = orFailWith(ExitStatus::unreadablePath, pack, [&] { return FileWrapper(url); });
    // A pack on disk holds its own added and replaced files.
    const DiffPackSnapshot update(wrapper, url);
    return Application(book, update, options, terminal).run();
  });
}
