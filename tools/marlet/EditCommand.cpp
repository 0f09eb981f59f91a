#include "EditCommand.h"

#include <algorithm>
#include <iostream>

#include "Book.h"
#include "Hunks.h"
#include "JSON.h"

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

/// The hunks of an edit of a text that its entry doesn't hold.
std::vector<DiffDescriptor> droppedHunks(const Book& book, const std::string& file,
                                         const std::optional<Data>& data,
                                         const std::optional<FileDiffDescriptor>& entry) {
  const auto authored = mergedUserEdit(makeUserEditDiffPack(book.snapshot, book.contentsUrl()), file);
  const auto original = authored ? utf16FromUTF8(authored->view()) : std::nullopt;
  const auto edited = data ? utf16FromUTF8(data->view()) : std::nullopt;
  if (!original || !edited) return {};
  auto hunks = userEditHunks(*original, *edited);
  const auto kept = entry ? hunksOf(*entry) : MarletDiff::DiffDescriptors();
  // Both lists are in the same order.
  const auto* next = kept.begin();
  std::erase_if(hunks, [&](const DiffDescriptor& hunk) {
    const bool isKept = next != kept.end() && *next == hunk;
    if (isKept) ++next;
    return isKept;
  });
  return hunks;
}

void write(const Book& book, const DiffPackSnapshot& pack) {
  auto root = book.document.wrapper;
  auto edits = root.child("Edits");
  if (!edits) {
    edits = FileWrapper::directory();
    edits->setPreferredFilename("Edits");
    root.addFileWrapper(*edits);
  }
  auto wrapper = pack.fileWrapper();
  wrapper.setPreferredFilename("UserEdits.diffpack");
  edits->addFileWrapper(std::move(wrapper));
  orFailWith(ExitStatus::failedWrite, book.document.path, [&] { root.write(book.document.url); });
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

ExitStatus edit(const std::string& path, const std::vector<std::string>& settings,
                const std::vector<std::string>& reverted, bool asJSON, const Terminal& terminal) {
  return guarded(path, terminal, [&] {
    const auto edits = readEdits(settings, reverted);
    // Saving again what was saved changes nothing, so this may run more than once.
    const auto result = withBook(path, [&](const Book& book) {
      const auto pack = updatedUserEditDiffPack(book.userEditPack(), edits);
      std::vector<SavedEdit> saved;
      for (const auto& [file, data] : edits) {
        const auto* entry = pack.updates.first(file);
        saved.push_back({file, entry ? std::optional(*entry) : std::nullopt, {}});
        saved.back().dropped = droppedHunks(book, file, data, saved.back().entry);
      }
      write(book, pack);
      return saved;
    });
    auto list = ordered_json::array();
    for (const auto& saved : result) {
      if (!asJSON) {
        print(saved, terminal);
        continue;
      }
      list.push_back(
          {{"file", saved.file},
           {"kind", saved.entry ? ordered_json(kindName(*saved.entry)) : ordered_json(nullptr)},
           {"kept", hunksJSON(saved.entry ? hunksOf(*saved.entry) : MarletDiff::DiffDescriptors())},
           {"dropped", hunksJSON(saved.dropped)}});
    }
    if (asJSON) std::cout << dumped(list) << "\n";
    return ExitStatus::good;
  });
}
