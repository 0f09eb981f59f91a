#include "support/Tree.h"

#include <stdlib.h>

#include <fstream>

#include "MarletFoundation/Data/PropertyListSerializable.h"

namespace MarletFoundation::test {
namespace {

std::string bytes(const Tree::Content& content) {
  if (const auto* text = std::get_if<std::string>(&content.value)) return *text;
  const auto data =
      PropertyListSerialization::write(std::get<PropertyListValue>(content.value), PropertyListFormat::xml);
  return std::string(data.view());
}

void add(FileWrapper& directory, std::string_view path, const Tree::Content& content) {
  const auto slash = path.find('/');
  const std::string name(path.substr(0, slash));
  if (slash == std::string_view::npos) {
    auto file = FileWrapper::regularFile(Data(bytes(content)));
    file.setPreferredFilename(name);
    directory.addFileWrapper(file);
    return;
  }
  auto child = directory.child(name);
  if (!child) {
    child = FileWrapper::directory();
    child->setPreferredFilename(name);
    directory.addFileWrapper(*child);
  }
  if (slash + 1 < path.size()) add(*child, path.substr(slash + 1), content);
}

}  // namespace

Tree Tree::with(const std::string& path, Content content) const {
  Tree copy = without(path);
  copy.files_[path] = std::move(content);
  return copy;
}

Tree Tree::without(const std::string& path) const {
  Tree copy = *this;
  std::erase_if(copy.files_,
                [&](const auto& file) { return file.first == path || file.first.starts_with(path + "/"); });
  return copy;
}

Tree Tree::withKey(const std::string& path, std::string_view key, PropertyListValue value) const {
  Tree copy = *this;
  std::get<PropertyListDictionary>(std::get<PropertyListValue>(copy.files_.at(path).value).payload)[key] =
      std::move(value);
  return copy;
}

Tree Tree::withoutKey(const std::string& path, std::string_view key) const {
  Tree copy = *this;
  std::get<PropertyListDictionary>(std::get<PropertyListValue>(copy.files_.at(path).value).payload)
      .erase(key);
  return copy;
}

FileWrapper Tree::wrapper() const {
  auto root = FileWrapper::directory();
  for (const auto& [path, content] : files_) add(root, path, content);
  return root;
}

void Tree::writeTo(const std::filesystem::path& directory) const {
  for (const auto& [path, content] : files_) {
    const auto target = directory / path;
    std::filesystem::create_directories(target.parent_path());
    if (path.ends_with('/')) {
      std::filesystem::create_directories(target);
    } else {
      std::ofstream(target, std::ios::binary) << bytes(content);
    }
  }
}

std::ostream& operator<<(std::ostream& out, const Tree& tree) {
  for (const auto& [path, content] : tree.files_) {
    const auto* value = std::get_if<PropertyListValue>(&content.value);
    out << path << ": " << (value ? description(*value) : std::get<std::string>(content.value)) << "\n";
  }
  return out;
}

TemporaryDirectory::TemporaryDirectory() {
  std::string name = std::filesystem::temp_directory_path() / "marlet-test-XXXXXX";
  if (!::mkdtemp(name.data())) throw std::runtime_error("no temporary directory");
  path_ = std::filesystem::canonical(name);
}

TemporaryDirectory::~TemporaryDirectory() {
  std::error_code ignored;
  std::filesystem::remove_all(path_, ignored);
}

URL TemporaryDirectory::url(std::string_view relativePath) const {
  const auto base = URL::file(path_.string(), true);
  return relativePath.empty() ? base : base.appendingPathComponent(relativePath);
}

}  // namespace MarletFoundation::test
