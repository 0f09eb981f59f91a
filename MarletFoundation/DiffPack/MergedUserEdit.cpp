#include "MarletFoundation/DiffPack/MergedUserEdit.h"

#include <cerrno>

#include "MarletDiff/ContentMerge.h"
#include "MarletFoundation/Platform/RelativePath.h"
#include "MarletFoundation/Platform/Text.h"

namespace MarletFoundation {
namespace {

using MarletDiff::FileDiffDescriptor;

struct CurrentContents {
  const DiffPackSnapshot& pack;
  std::string_view filePath;

  std::optional<Data> operator()(const FileDiffDescriptor::Removed&) const { return std::nullopt; }
  std::optional<Data> operator()(const FileDiffDescriptor::Added& file) const { return carried(file.data); }
  std::optional<Data> operator()(const FileDiffDescriptor::Replaced& file) const {
    return carried(file.data);
  }

  std::optional<Data> operator()(const FileDiffDescriptor::Modified& file) const {
    const auto authored = wellFormed(utf16FromUTF8(authoredData().view()));
    const auto merged = MarletDiff::mergeContent(authored, file.diff);
    return Data(wellFormed(utf8FromUTF16(merged)));
  }

  Data authoredData() const { return readDescendant(pack.contentUrl, filePath); }

 private:
  Data carried(const std::optional<Data>& data) const { return data ? *data : authoredData(); }

  template <class Text>
  Text wellFormed(std::optional<Text> text) const {
    if (!text) throw ErrorObject::posix(EILSEQ, pack.contentUrl.appendingPathComponent(filePath).path());
    return std::move(*text);
  }
};

}  // namespace

std::optional<Data> mergedUserEdit(const DiffPackSnapshot& pack, std::string_view filePath) {
  const CurrentContents contents{pack, filePath};
  if (const auto* entry = pack.updates.first(filePath)) return std::visit(contents, entry->change);
  try {
    return contents.authoredData();
  } catch (const ErrorObject&) {
    return std::nullopt;
  }
}

}  // namespace MarletFoundation
