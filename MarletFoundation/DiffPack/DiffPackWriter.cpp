#include <cerrno>

#include "MarletFoundation/Data/PropertyListSerializable.h"
#include "MarletFoundation/DiffPack/DiffPackFormat.h"
#include "MarletFoundation/DiffPack/DiffPackSnapshot.h"
#include "MarletFoundation/DiffPack/PackPaths.h"
#include "MarletFoundation/DiffPack/TreePaths.h"
#include "MarletFoundation/Platform/RelativePath.h"
#include "MarletFoundation/Platform/Text.h"

namespace MarletFoundation {
namespace {

using namespace DiffPackFormat;
using MarletDiff::DiffDescriptor;
using MarletDiff::FileDiffDescriptor;
using Dictionary = PropertyListDictionary;

FileWrapper propertyListFile(const PropertyListValue& value) {
  return FileWrapper::regularFile(PropertyListSerialization::write(value, PropertyListFormat::xml));
}

/// Writes one pack; an object serves for one call.
class DiffPackWriter {
 public:
  explicit DiffPackWriter(const DiffPackSnapshot& pack) : pack_(pack) {}

  FileWrapper write() {
    for (const auto& update : pack_.updates) {
      sections_[update.change.index()].push_back(std::visit(*this, update.change));
    }
    Dictionary updates;
    for (std::size_t tag = 0; tag < std::size(sectionKeys); ++tag) {
      updates[sectionKeys[tag]] = std::move(sections_[tag]);
    }
    // Last, so that no file of the pack takes its place.
    place(manifestFilename, propertyListFile(Dictionary{{diffPackTypeKey, description(pack_.diffPackType)},
                                                        {documentTypeKey, description(pack_.documentType)},
                                                        {nameKey, pack_.name},
                                                        {baseVersionKey, pack_.baseVersion},
                                                        {updateVersionKey, pack_.updateVersion},
                                                        {updatesKey, std::move(updates)}}));
    return root_;
  }

  // Each case places its file, if it has one, and returns its entry in the manifest.
  Dictionary operator()(const FileDiffDescriptor::Removed& file) { return {{fileKey, file.path}}; }
  Dictionary operator()(const FileDiffDescriptor::Added& file) { return carry(file.path, file.data); }
  Dictionary operator()(const FileDiffDescriptor::Replaced& file) { return carry(file.path, file.data); }

  Dictionary operator()(const FileDiffDescriptor::Modified& file) {
    auto delta = deltaPath(file.path);
    PropertyListValue::Array descriptors;
    for (const auto& descriptor : file.diff) descriptors.push_back(dictionary(descriptor, file.path));
    place(delta, propertyListFile(Dictionary{{fileKey, file.path}, {diffKey, std::move(descriptors)}}));
    return {{fileKey, file.path}, {diffKey, std::move(delta)}};
  }

 private:
  Dictionary carry(const std::string& path, const std::optional<Data>& data) {
    place(path, data ? FileWrapper::regularFile(*data) : contentFile(path));
    return {{fileKey, path}};
  }

  FileWrapper contentFile(const std::string& path) {
    if (!content_) content_ = FileWrapper(pack_.contentUrl);
    auto file = descendant(*content_, path);
    if (!file) throw pathError(relativePathComponents(path) ? ENOENT : EINVAL, path);
    if (!file->isRegularFile() && !file->isDirectory()) throw pathError(EINVAL, path);
    return *file;
  }

  Dictionary dictionary(const DiffDescriptor& descriptor, const std::string& path) const {
    const auto text = [&](const std::u16string& content) {
      auto utf8 = utf8FromUTF16(content);
      if (!utf8) throw pathError(EILSEQ, path);
      return std::move(*utf8);
    };
    return {{originalRangeKey, rangeString(descriptor.originalRange)},
            {modifiedRangeKey, rangeString(descriptor.modifiedRange)},
            {originalContentKey, text(descriptor.originalContent)},
            {modifiedContentKey, text(descriptor.modifiedContent)}};
  }

  void place(std::string_view path, FileWrapper file) {
    const auto names = relativePathComponents(path);
    if (!names) throw pathError(EINVAL, path);
    addDescendant(root_, *names, std::move(file));
  }

  ErrorObject pathError(int errorNumber, std::string_view path) const {
    return ErrorObject::posix(errorNumber, pack_.contentUrl.appendingPathComponent(path).path());
  }

  const DiffPackSnapshot& pack_;
  FileWrapper root_ = FileWrapper::directory();
  /// The tree below `contentUrl`, opened when the first file of it is needed.
  std::optional<FileWrapper> content_;
  PropertyListValue::Array sections_[std::variant_size_v<FileDiffDescriptor::Change>];
};

}  // namespace

FileWrapper DiffPackSnapshot::fileWrapper() const { return DiffPackWriter(*this).write(); }

}  // namespace MarletFoundation
