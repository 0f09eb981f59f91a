#include <stdlib.h>

#include <cstdio>
#include <filesystem>

#include "MarletFoundation/DiffPack/MergedUserEdit.h"
#include "MarletFoundation/Platform/FileManager.h"

using namespace MarletFoundation;

namespace {

/// A content directory of one file, "a", that lives until the process ends.
class Content {
 public:
  Content() {
    std::string name = std::filesystem::temp_directory_path() / "marlet-fuzz-XXXXXX";
    if (!::mkdtemp(name.data())) std::abort();
    path_ = name;
  }
  ~Content() { std::filesystem::remove_all(path_); }

  URL url() const { return URL::file(path_.string(), true); }
  void setFile(std::string_view text) const {
    auto* file = std::fopen((path_ / "a").c_str(), "wb");
    std::fwrite(text.data(), 1, text.size(), file);
    std::fclose(file);
  }

 private:
  std::filesystem::path path_;
};

/// The next piece of the input, up to a byte that no property list in XML form has.
std::string piece(std::string_view& input) {
  const auto text = input.substr(0, input.find('\x1e'));
  input.remove_prefix(std::min(text.size() + 1, input.size()));
  return std::string(text);
}

void require(bool condition) {
  if (!condition) std::abort();
}

void exercise(const FileWrapper& wrapper, std::string_view authored) {
  static const Content content;
  const DiffPackSnapshot pack(wrapper, content.url());
  content.setFile(authored);
  for (const auto& update : pack.updates) {
    try {
      mergedUserEdit(pack, update.filePath());
    } catch (const ErrorObject&) {
    }
  }
  const DiffPackSnapshot again(pack.fileWrapper(), content.url());
  require(again.description() == pack.description() && again.updates.size() == pack.updates.size());
  for (std::size_t i = 0; i < pack.updates.size(); ++i) {
    require(again.updates[i].filePath() == pack.updates[i].filePath());
    require(again.updates[i].change.index() == pack.updates[i].change.index());
  }
}

}  // namespace

/// Pieces: the manifest, the delta "a.delta", the files "a" and "d/b" of the pack, and the authored file "a".
extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* bytes, std::size_t size) {
  std::string_view input(reinterpret_cast<const char*>(bytes), size);
  const auto file = [&] { return FileWrapper::regularFile(Data(piece(input))); };
  FileWrapper::Children children{{"Manifest.plist", file()}, {"a.delta", file()}, {"a", file()}};
  children.insert_or_assign("d", FileWrapper::directory({{"b", file()}}));
  try {
    exercise(FileWrapper::directory(std::move(children)), piece(input));
  } catch (const ErrorObject&) {
  }
  return 0;
}
