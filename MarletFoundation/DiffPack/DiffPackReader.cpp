#include "MarletFoundation/DiffPack/DiffPackReader.h"

#include <algorithm>
#include <map>

#include "MarletFoundation/Data/PropertyListSerializable.h"
#include "MarletFoundation/DiffPack/DiffPackFormat.h"
#include "MarletFoundation/Platform/RelativePath.h"
#include "MarletFoundation/Platform/Text.h"

namespace MarletFoundation {
namespace {

using namespace DiffPackFormat;
using MarletDiff::DiffDescriptor;
using MarletDiff::DiffDescriptors;
using MarletDiff::FileDiffDescriptor;
using Dictionary = PropertyListDictionary;

constexpr std::string_view invalidUpdateEntry = "Invalid Manifest.plist, encountered invalid update entry";

ErrorObject failure(std::string message, ErrorPointer cause = nullptr) {
  return diffError(DiffErrorCode::CriticalDiffPackDeserializationError, std::move(message), std::move(cause));
}
ErrorObject failure(std::string_view message, std::string_view subject) {
  return failure(std::string(message).append(subject));
}

const std::string* stringAt(const Dictionary& dictionary, std::string_view key) {
  const auto* value = dictionary.find(key);
  return value ? value->string() : nullptr;
}

const std::string& requiredString(const Dictionary& manifest, std::string_view key,
                                  std::string_view message) {
  const auto* string = stringAt(manifest, key);
  if (!string) throw failure(message, "");
  return *string;
}

/// The one of `cases` that the manifest names under `key`.
template <class Enumeration>
Enumeration requiredCase(const Dictionary& manifest, std::string_view key,
                         std::initializer_list<Enumeration> cases, std::string_view message) {
  const auto* name = stringAt(manifest, key);
  for (const auto candidate : cases) {
    if (name && *name == description(candidate)) return candidate;
  }
  throw failure(message, optionalDescription(manifest.find(key)));
}

PropertyListValue readManifest(const FileWrapper& pack) {
  if (!pack.isDirectory() || !pack.hasChildren()) {
    throw failure("Invalid diffpack format, no directory contents.");
  }
  const auto file = pack.child(manifestFilename);
  const auto contents = file && file->isRegularFile() ? file->regularFileContents() : std::nullopt;
  if (!contents) throw failure("Invalid diffpack format, missing Manifest.plist");
  try {
    return PropertyListSerialization::read(*contents);
  } catch (const Error& error) {
    throw failure("Invalid Manifest.plist format", error.copy());
  }
}

using Unreadable = PartialDiffPack::Unreadable;

/// Reads the entries of the updates; those that can't be read go to a list, if there is one.
class UpdatesReader {
 public:
  UpdatesReader(const FileWrapper& pack, DiffPackType type, std::vector<Unreadable>* unreadable)
      : pack_(pack), type_(type), unreadable_(unreadable) {}

  std::vector<FileDiffDescriptor> read(const Dictionary& updates) {
    std::vector<FileDiffDescriptor> entries;
    for (const auto& [key, section] : updates) {
      const auto* elements = section.array();
      const auto name = std::find(std::begin(sectionKeys), std::end(sectionKeys), key.view());
      if (name == std::end(sectionKeys) || !elements) throw failure(invalidUpdateEntry, "");
      for (const auto& element : *elements) {
        if (const auto* entry = element.dictionary()) add(*name, *entry, entries);
      }
    }
    return entries;
  }

 private:
  void add(std::string_view section, const Dictionary& entry, std::vector<FileDiffDescriptor>& entries) {
    const auto* path = stringAt(entry, fileKey);
    if (!path) throw failure(invalidUpdateEntry, "");
    try {
      entries.push_back({change(section, *path, entry)});
    } catch (const Error& error) {
      if (!unreadable_) throw;
      unreadable_->push_back({*path, section, error.copy()});
    }
  }

  FileDiffDescriptor::Change change(std::string_view section, const std::string& path,
                                    const Dictionary& entry) {
    if (section == "Added") return FileDiffDescriptor::Added{path, carriedData(path)};
    if (section == "Removed") return FileDiffDescriptor::Removed{path};
    if (section == "Replaced") return FileDiffDescriptor::Replaced{path, carriedData(path)};
    const auto* deltaPath = stringAt(entry, diffKey);
    if (!deltaPath) throw failure(invalidUpdateEntry, "");
    return FileDiffDescriptor::Modified{path, delta(*deltaPath)};
  }

  /// What the pack holds of an added or replaced file. An update pack's files stay on disk until it is
  /// applied.
  std::optional<Data> carriedData(const std::string& path) const {
    if (type_ == DiffPackType::UpdatePack) return std::nullopt;
    const auto found = file(path);
    if (!found) throw failure("Invalid Diff Pack, missing  file ", path);
    return found->regularFileContents();
  }

  /// Any number of entries may name one delta; it is read once, whatever their way of writing its path.
  DiffDescriptors delta(const std::string& path) {
    const auto found = file(path);
    if (!found) throw failure("Invalid Diff Pack, missing .delta file ", path);
    const auto key = *relativePathComponents(path);
    const auto known = deltas_.find(key);
    return known != deltas_.end() ? known->second
                                  : deltas_.emplace(key, readDelta(*found, path)).first->second;
  }

  static DiffDescriptors readDelta(const FileWrapper& file, const std::string& path) {
    const auto invalid = [&] { return failure("Invalid Diff Pack, invalid .delta file ", path); };
    const auto contents = file.regularFileContents();
    if (!contents) throw invalid();
    const auto value = PropertyListSerialization::read(*contents);
    const auto* root = value.dictionary();
    const auto* list = root ? root->find(diffKey) : nullptr;
    const auto* elements = list ? list->array() : nullptr;
    if (!elements) throw invalid();
    std::vector<DiffDescriptor> descriptors;
    for (const auto& element : *elements) {
      const auto* entry = element.dictionary();
      auto descriptor = entry ? diffDescriptor(*entry) : std::nullopt;
      if (!descriptor) throw failure("Invalid Diff Pack, encountered invalid .delta file entry ", path);
      descriptors.push_back(std::move(*descriptor));
    }
    return descriptors;
  }

  static std::optional<DiffDescriptor> diffDescriptor(const Dictionary& entry) {
    const auto* originalRange = stringAt(entry, originalRangeKey);
    const auto* modifiedRange = stringAt(entry, modifiedRangeKey);
    const auto* originalContent = stringAt(entry, originalContentKey);
    const auto* modifiedContent = stringAt(entry, modifiedContentKey);
    if (!originalRange || !modifiedRange || !originalContent || !modifiedContent) return std::nullopt;
    auto original = utf16FromUTF8(*originalContent), modified = utf16FromUTF8(*modifiedContent);
    if (!original || !modified) return std::nullopt;
    return DiffDescriptor{rangeFromString(*originalRange), rangeFromString(*modifiedRange),
                          std::move(*original), std::move(*modified)};
  }

  /// The regular file at a path of the pack, or nothing.
  std::optional<FileWrapper> file(std::string_view path) const {
    auto node = descendant(pack_, path);
    return node && node->isRegularFile() ? node : std::nullopt;
  }

  const FileWrapper& pack_;
  DiffPackType type_;
  std::vector<Unreadable>* unreadable_;
  /// What was read of the deltas, by the components of their paths.
  std::map<std::vector<std::string_view>, DiffDescriptors> deltas_;
};

}  // namespace

DiffPackSnapshot readDiffPack(const FileWrapper& pack, URL contentUrl, std::vector<Unreadable>* unreadable) {
  const auto value = readManifest(pack);
  const auto* manifest = value.dictionary();
  if (!manifest) throw failure("Invalid Manifest.plist format, manifest root is not a dictionary");
  const auto type =
      requiredCase(*manifest, diffPackTypeKey, {DiffPackType::UpdatePack, DiffPackType::UserEditPack},
                   "Invalid Manifest.plist DiffPackType entry: ");
  const auto document = requiredCase(*manifest, documentTypeKey, {DiffPackDocumentType::MarletBook},
                                     "Invalid Manifest.plist DocumentType entry: ");
  const auto& name = requiredString(*manifest, nameKey, "Invalid Manifest.plist, missing Name entry");
  const auto& base =
      requiredString(*manifest, baseVersionKey, "Invalid Manifest.plist, missing BaseVersion entry");
  const auto& update =
      requiredString(*manifest, updateVersionKey, "Invalid Manifest.plist, missing UpdateVersion entry");
  const auto* updates = manifest->find(updatesKey);
  if (!updates || !updates->dictionary()) throw failure("Invalid Manifest.plist, missing Updates entry");
  return {type,
          document,
          std::move(contentUrl),
          name,
          base,
          update,
          UpdatesReader(pack, type, unreadable).read(*updates->dictionary())};
}

DiffPackSnapshot::DiffPackSnapshot(const FileWrapper& fileWrapper, URL content)
    : DiffPackSnapshot(readDiffPack(fileWrapper, std::move(content))) {}

PartialDiffPack::PartialDiffPack(const FileWrapper& fileWrapper, URL contentUrl)
    : pack(readDiffPack(fileWrapper, std::move(contentUrl), &unreadable)) {}

}  // namespace MarletFoundation
