#include "EditCommand.h"

#include <algorithm>
#include <iostream>

#include "Book.h"
#include "Ending.h"
#include "Hunks.h"
#include "JSON.h"
#include "MarletFoundation/DiffPack/PackPaths.h"
#include "MarletFoundation/Platform/Text.h"

using namespace MarletFoundation;
using nlohmann::ordered_json;

namespace {

using MarletDiff::DiffDescriptor;
using MarletDiff::FileDiffDescriptor;

/// What became of one edited file.
struct SavedEdit {
  std::string file;
  std::optional<FileDiffDescriptor> entry;
  std::vector<DiffDescriptor> dropped;
};

UserEdits readEdits(const std::vector<std::string>& settings, const std::vector<std::string>& reverted) {
  UserEdits edits;
  for (const auto& setting : settings) {
    const auto equals = setting.find('=');
    if (equals == std::string::npos)
      throw CommandFailure{ExitStatus::wrongUsage, setting + ": give the edited file as PATH=FILE."};
    const auto file = setting.substr(equals + 1);
    edits[setting.substr(0, equals)] =
        orFailWith(ExitStatus::unreadablePath, file, [&] { return FileManager::readFile(URL::file(file)); });
  }
  for (const auto& path : reverted) edits[path] = std::nullopt;
  return edits;
}

/// The hunks of an edit of a text that its entry doesn't keep. An entry that holds the whole text keeps what leads to it.
std::vector<DiffDescriptor> droppedHunks(const MendableBook& book,
                                         const std::optional<FileDiffDescriptor>& entry,
                                         const std::string& file, const std::optional<Data>& data) {
  const auto authored = mergedUserEdit(makeUserEditDiffPack(book.snapshot, book.contentsUrl()), file);
  const auto original = authored ? utf16FromUTF8(authored->view()) : std::nullopt;
  const auto edited = data ? utf16FromUTF8(data->view()) : std::nullopt;
  if (!original || !edited) return {};
  auto hunks = userEditHunks(*original, *edited);
  auto kept = entry ? hunksOf(*entry) : MarletDiff::DiffDescriptors();
  const auto* whole = entry ? std::get_if<FileDiffDescriptor::Replaced>(&entry->change) : nullptr;
  if (const auto text = whole && whole->data ? utf16FromUTF8(whole->data->view()) : std::nullopt)
    kept = userEditHunks(*original, *text);
  // Both lists are in the same order.
  const auto* next = kept.begin();
  std::erase_if(hunks, [&](const DiffDescriptor& hunk) {
    const bool isKept = next != kept.end() && *next == hunk;
    if (isKept) ++next;
    return isKept;
  });
  return hunks;
}

/// What can't be read would be gone from a pack that is written anew, unless it is named.
void requireNothingElseUnreadable(const MendableBook& book, const UserEdits& edits) {
  for (const auto& entry : book.unreadable()) {
    const auto names = [&](const auto& edit) { return plainPath(edit.first) == plainPath(entry.filePath); };
    if (std::any_of(edits.begin(), edits.end(), names)) continue;
    const auto mended =
        "Take it back with --revert " + entry.filePath + ", or put the pack aside with --set-aside.";
    throw CommandFailure{ExitStatus::negative,
                         book.document.path + ": " + entry.filePath +
                             " can't be read from the learner's pack: " + wordsOf(*entry.error) +
                             suggested(wordsOf(*entry.error), mended)};
  }
}

/// Opens the book, saves the edits and writes it. Saving again what was saved changes nothing, so this may run more
/// than once.
std::vector<SavedEdit> save(const MendableBook& book, const UserEdits& edits) {
  requireNothingElseUnreadable(book, edits);
  const auto pack = updatedUserEditDiffPack(book.userEditPack(), edits);
  std::vector<SavedEdit> saved;
  for (const auto& [path, data] : edits) {
    const auto file = plainPath(path);
    const auto* found = pack.updates.first(file);
    auto entry = found ? std::optional(*found) : std::nullopt;
    auto dropped = droppedHunks(book, entry, file, data);
    saved.push_back({file, std::move(entry), std::move(dropped)});
  }
  setUserEdits(book.document.wrapper, checkedFileWrapper(pack));
  commit(book.document.path, [&] { book.document.wrapper.write(book.document.url); });
  return saved;
}

ExitStatus setAside(const std::string& path, bool asJSON) {
  const auto document = openBookDocument(path);
  if (!userEditsIn(document.wrapper))
    throw CommandFailure{ExitStatus::negative, path + ": there are no edits to put aside."};
  std::string place;
  try {
    place = setUserEditsAside(document.url);
  } catch (const ErrorObject& error) {
    if (error.domain() != PosixErrorDomain) throw;
    throw CommandFailure{ExitStatus::failedWrite, path + ": " + wordsWithSuggestion(error)};
  }
  if (asJSON) {
    std::cout << dumped({{"setAside", place}}) << "\n";
  } else {
    std::cout << "Set aside: " << printable(place) << "\n";
  }
  return ExitStatus::good;
}

void print(const SavedEdit& saved, const Terminal& terminal) {
  const auto count = saved.entry ? hunksOf(*saved.entry).size() : 0;
  std::cout << printable(saved.file) << ": "
            << (saved.entry ? std::string(kindName(*saved.entry)) : "as authored")
            << (count > 0 ? ", " + counted(count, "hunk") : "") << "\n";
  if (saved.dropped.empty()) return;
  std::cout << counted(saved.dropped.size(), "hunk") << " dropped, not editable:\n";
  for (const auto& hunk : saved.dropped) printHunk(hunk, terminal);
}

}  // namespace

ExitStatus edit(const std::string& path, const EditOptions& options, const Terminal& terminal) {
  return guarded(path, terminal, [&] {
    if (options.setAside) return setAside(path, options.asJSON);
    const auto edits = readEdits(options.settings, options.reverted);
    const auto result = committing(path, [&] {
      return withBook<MendableBook>(path, [&](const MendableBook& book) { return save(book, edits); });
    });
    auto list = ordered_json::array();
    for (const auto& saved : result) {
      if (!options.asJSON) {
        print(saved, terminal);
        continue;
      }
      list.push_back(
          {{"file", saved.file},
           {"kind", saved.entry ? ordered_json(kindName(*saved.entry)) : ordered_json(nullptr)},
           {"kept", hunksJSON(saved.entry ? hunksOf(*saved.entry) : MarletDiff::DiffDescriptors())},
           {"dropped", hunksJSON(saved.dropped)}});
    }
    if (options.asJSON) std::cout << dumped(list) << "\n";
    return ExitStatus::good;
  });
}
