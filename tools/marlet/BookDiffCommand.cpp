#include "BookDiffCommand.h"

#include <algorithm>
#include <filesystem>
#include <iostream>
#include <set>

#include "Ending.h"
#include "Guarded.h"
#include "Hunks.h"
#include "JSON.h"
#include "MarletFoundation/MarletFoundation.h"
#include "Writing.h"

using namespace MarletFoundation;
using nlohmann::ordered_json;

namespace {

using MarletDiff::FileDiffDescriptor;

/// The file that an entry puts into a pack's directory, or nothing.
std::optional<std::string> fileInPack(const FileDiffDescriptor& entry) {
  if (std::holds_alternative<FileDiffDescriptor::Removed>(entry.change)) return std::nullopt;
  const bool isModified = std::holds_alternative<FileDiffDescriptor::Modified>(entry.change);
  return entry.filePath() + (isModified ? ".delta" : "");
}

/// A pack in which one file would take another's place, or lie below it, can't be written.
void requireNoCollision(const DiffPackSnapshot& pack) {
  const auto collision = [](const std::string& path) {
    return CommandFailure{
        ExitStatus::negative,
        path + ": this file would take the place of another one in the pack." +
            (path == "Manifest.plist" ? " Write the book's manifest as XML first, with marlet plist --to xml."
                                      : " Give it another name.")};
  };
  std::set<std::string> files{"Manifest.plist"};
  for (const auto& entry : pack.updates) {
    const auto path = fileInPack(entry);
    if (path && !files.insert(*path).second) throw collision(*path);
  }
  for (const auto& path : files) {
    for (auto slash = path.find('/'); slash != std::string::npos; slash = path.find('/', slash + 1)) {
      if (files.contains(path.substr(0, slash))) throw collision(path.substr(0, slash));
    }
  }
}

/// A pack carries regular files only.
void requireNoLinks(const DiffPackSnapshot& pack, const URL& updated) {
  const auto contents = std::filesystem::path(updated.path()) / "Contents";
  for (const auto& entry : pack.updates) {
    const auto path = fileInPack(entry);
    std::error_code unknown;
    if (path && std::filesystem::is_symlink(contents / *path, unknown))
      throw CommandFailure{ExitStatus::negative, *path + ": a pack can't carry a symbolic link."};
  }
}

bool isUpdate(const URL& url) {
  try {
    return DiffPackSnapshot(FileWrapper(url), url).diffPackType == DiffPackType::UpdatePack;
  } catch (const Error&) {
    return false;
  }
}

/// A former update may be replaced, but nothing else, and least of all what a learner has.
void requireNothingButAnUpdateAt(const URL& url, const std::string& output) {
  if (!isUpdate(url)) requireNothingAt(output);
}

/// A book is no place for a pack, under whatever name its directories are reached.
void requireOutsideOfBooks(const std::string& output, const std::vector<URL>& books) {
  std::error_code unknown;
  auto place = std::filesystem::weakly_canonical(output, unknown);
  const auto isBook = [&](const std::filesystem::path& directory) {
    return directory.extension() == ".marletbook" ||
           std::any_of(books.begin(), books.end(), [&](const URL& book) {
             return std::filesystem::equivalent(directory, book.path(), unknown);
           });
  };
  for (auto directory = place.parent_path(); directory.has_relative_path();
       directory = directory.parent_path()) {
    if (isBook(directory))
      throw CommandFailure{ExitStatus::failedWrite,
                           output + ": this lies in a book. Give the pack another place."};
  }
}

/// Where the pack is to be written, if it can be.
URL requiredPlace(const DiffPackSnapshot& pack, const URL& original, const URL& updated,
                  const std::string& output) {
  auto url = URL::file(output, true).standardized();
  if (url.pathExtension() != "diffpack") {
    throw CommandFailure{ExitStatus::wrongUsage, output + ": a pack's name ends in .diffpack."};
  }
  requireNoCollision(pack);
  requireNoLinks(pack, updated);
  requireOutsideOfBooks(url.path(), {original, updated});
  requireNothingButAnUpdateAt(url, output);
  return url;
}

ordered_json json(const DiffPackSnapshot& pack) {
  auto files = ordered_json::array();
  for (const auto& entry : pack.updates) {
    files.push_back(
        {{"file", entry.filePath()}, {"kind", kindName(entry)}, {"hunks", hunksJSON(hunksOf(entry))}});
  }
  return {{"name", pack.name},
          {"baseVersion", pack.baseVersion},
          {"updateVersion", pack.updateVersion},
          {"files", std::move(files)}};
}

void print(const DiffPackSnapshot& pack, bool withHunks, const Terminal& terminal) {
  std::cout << terminal.styled(Terminal::Style::bold, printable(pack.description())) << "\n";
  for (const auto& entry : pack.updates) {
    const auto hunks = hunksOf(entry);
    const bool isModified = std::holds_alternative<FileDiffDescriptor::Modified>(entry.change);
    std::cout << kindName(entry) << " " << printable(entry.filePath())
              << (isModified ? ", " + counted(hunks.size(), "hunk") : "") << "\n";
    if (!withHunks) continue;
    for (const auto& hunk : hunks) printHunk(hunk, terminal);
  }
}

}  // namespace

ExitStatus diffBooks(const std::string& original, const std::string& updated, const BookDiffOptions& options,
                     const Terminal& terminal) {
  return guarded(updated, terminal, [&] {
    const auto urlOf = [](const std::string& path) {
      return orFailWith(ExitStatus::unreadablePath, path, [&] {
        auto url = URL::file(path, true).standardized();
        FileManager::resourceIsReachable(url);
        return url;
      });
    };
    const auto originalUrl = urlOf(original);
    const auto updatedUrl = urlOf(updated);
    const auto pack = makeUpdateDiffPack(originalUrl, updatedUrl);
    const auto place = options.output
                           ? std::optional(requiredPlace(pack, originalUrl, updatedUrl, *options.output))
                           : std::nullopt;
    if (options.asJSON) {
      std::cout << dumped(json(pack)) << "\n";
    } else if (!options.output || options.withHunks) {
      print(pack, options.withHunks, terminal);
    }
    if (place) {
      const auto tree = pack.fileWrapper();
      requirePrinted();
      commit(*options.output, [&] { tree.write(*place); });
    }
    return options.exitCode && !pack.updates.empty() ? ExitStatus::negative : ExitStatus::good;
  });
}
