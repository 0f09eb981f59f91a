#include "LearnerText.h"

#include <iostream>

#include "Book.h"
#include "Hunks.h"
#include "JSON.h"
#include "SafeOutput.h"

using namespace MarletFoundation;
using nlohmann::ordered_json;

ExitStatus printLearnerText(const std::string& path, const std::string& file, const Terminal& terminal) {
  return guarded(path, terminal, [&] {
    const auto text =
        withBook(path, [&](const Book& book) { return mergedUserEdit(book.userEditPack(), file); });
    if (!text) throw CommandFailure{ExitStatus::negative, file + ": the learner sees no such file."};
    printText(text->view());
    return ExitStatus::good;
  });
}

ExitStatus listEdits(const std::string& path, bool asJSON, const Terminal& terminal) {
  return guarded(path, terminal, [&] {
    const auto [pack, unreadable] = withBook<MendableBook>(
        path, [](const MendableBook& book) { return std::pair(book.userEditPack(), book.unreadable()); });
    auto list = ordered_json::array();
    for (const auto& entry : pack.updates) {
      const auto count = hunksOf(entry).size();
      const bool isModified = std::holds_alternative<MarletDiff::FileDiffDescriptor::Modified>(entry.change);
      if (asJSON) {
        list.push_back({{"file", entry.filePath()}, {"kind", kindName(entry)}, {"hunks", count}});
      } else {
        std::cout << kindName(entry) << " " << printable(entry.filePath())
                  << (isModified ? ", " + counted(count, "hunk") : "") << "\n";
      }
    }
    for (const auto& entry : unreadable) {
      const auto words = wordsWithSuggestion(*entry.error);
      if (asJSON) {
        list.push_back({{"file", entry.filePath}, {"kind", entry.section}, {"hunks", 0}, {"error", words}});
      } else {
        std::cout << entry.section << " " << printable(entry.filePath)
                  << ", can't be read: " << printable(words) << "\n";
      }
    }
    if (asJSON) std::cout << dumped(list) << "\n";
    return unreadable.empty() ? ExitStatus::good : ExitStatus::negative;
  });
}
