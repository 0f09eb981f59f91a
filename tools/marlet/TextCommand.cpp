#include "TextCommand.h"

#include <algorithm>
#include <iostream>

#include "Ending.h"
#include "Guarded.h"
#include "Hunks.h"
#include "JSON.h"
#include "MarletDiff/ContentDiff.h"
#include "MarletDiff/ContentMerge.h"
#include "MarletFoundation/MarletFoundation.h"
#include "MarletFoundation/Platform/Text.h"
#include "SafeOutput.h"

using namespace MarletFoundation;

namespace {

bool isDirectory(const std::string& path) {
  return orFailWith(ExitStatus::unreadablePath, path,
                    [&] { return FileManager::isDirectory(URL::file(path)); });
}

Data readText(const std::string& path) {
  auto data =
      orFailWith(ExitStatus::unreadablePath, path, [&] { return FileManager::readFile(URL::file(path)); });
  if (!isValidUTF8(data.view()))
    throw CommandFailure{ExitStatus::negative, path + ": this is not text in UTF-8."};
  return data;
}

std::vector<MarletDiff::DiffDescriptor> smallerHunks(const Data& original, const Data& updated) {
  return MarletDiff::diffContent(original.view(), updated.view(), MarletDiff::DiffOptions::SmallerHunks);
}

ExitStatus diffTexts(const std::string& original, const std::string& updated, const BookDiffOptions& options,
                     const Terminal& terminal) {
  if (options.output) {
    throw CommandFailure{ExitStatus::wrongUsage,
                         *options.output + ": a pack is made of two books, not of files."};
  }
  const auto before = readText(original), after = readText(updated);
  const auto hunks = smallerHunks(before, after);
  if (options.asJSON) {
    std::cout << dumped(hunksJSON(hunks)) << "\n";
  } else {
    for (const auto& hunk : hunks) printHunk(hunk, terminal);
  }
  return options.exitCode && !hunks.empty() ? ExitStatus::negative : ExitStatus::good;
}

/// The place and the three texts of a conflict.
void printConflict(const ErrorObject& error, const std::u16string& base, const std::string& path,
                   const Terminal& terminal) {
  const auto location = std::get<std::int64_t>(error.value(MarletDiff::LocationKey).value());
  const auto line = 1 + std::count(base.begin(), base.begin() + location, u'\n');
  terminal.complain(path + ":" + std::to_string(line) + ": " + error.localizedDescription());
  const std::pair<const char*, std::string_view> texts[] = {
      {"base", MarletDiff::BaseTextKey}, {"ours", MarletDiff::TextKey}, {"theirs", MarletDiff::OtherTextKey}};
  for (const auto& [name, key] : texts) {
    std::cerr << name << ": " << quoted(std::get<std::string>(error.value(key).value())) << "\n";
  }
}

}  // namespace

ExitStatus diff(const std::string& original, const std::string& updated, const BookDiffOptions& options,
                const Terminal& terminal) {
  return guarded(updated, terminal, [&] {
    if (isDirectory(original) || isDirectory(updated)) return diffBooks(original, updated, options, terminal);
    return diffTexts(original, updated, options, terminal);
  });
}

ExitStatus merge(const std::string& base, const std::string& ours, const std::string& theirs,
                 const std::optional<std::string>& output, const Terminal& terminal) {
  return guarded(base, terminal, [&] {
    const auto text = readText(base), ourText = readText(ours), theirText = readText(theirs);
    std::string merged;
    try {
      merged =
          MarletDiff::mergeContent(text.view(), smallerHunks(text, ourText), smallerHunks(text, theirText));
    } catch (const ErrorObject& error) {
      printConflict(error, *utf16FromUTF8(text.view()), base, terminal);
      return ExitStatus::negative;
    }
    if (!output) {
      printText(merged);
      return ExitStatus::good;
    }
    commit(*output, [&] { FileManager::writeFileAtomically(URL::file(*output), Data(std::move(merged))); });
    return ExitStatus::good;
  });
}
