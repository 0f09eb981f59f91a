#include <gtest/gtest.h>

#include "DiffPack/Packs.h"
#include "MarletFoundation/Data/PropertyListSerializable.h"

namespace MarletFoundation::test {
namespace {

DiffPackSnapshot pack(std::vector<FileDiff> updates, const URL& contentUrl = URL::file("/nowhere", true)) {
  return {DiffPackType::UserEditPack, DiffPackDocumentType::MarletBook, contentUrl, "name", "1.0", "1.0",
          std::move(updates)};
}

/// The paths of a tree's files and their contents, property lists as they print.
std::map<std::string, std::string> files(const FileWrapper& directory, const std::string& prefix = "") {
  std::map<std::string, std::string> found;
  const auto children = directory.fileWrappers().value();
  for (const auto& [name, node] : children) {
    EXPECT_EQ(node.preferredFilename(), name);
    if (node.isDirectory()) {
      found.merge(files(node, prefix + name + "/"));
    } else {
      const auto contents = node.regularFileContents().value();
      const bool isPropertyList = contents.view().starts_with("<?xml");
      found[prefix + name] = isPropertyList ? description(PropertyListSerialization::read(contents))
                                            : std::string(contents.view());
    }
  }
  return found;
}

std::string written(const DiffPackSnapshot& snapshot) {
  try {
    std::string paths;
    for (const auto& [path, contents] : files(snapshot.fileWrapper())) paths += path + " ";
    return paths;
  } catch (const ErrorObject& error) {
    return std::string(error.domain()) + " " + std::to_string(error.code());
  }
}

const Data data(std::string("data"));

TEST(DiffPackWriting, WritesEveryKindOfEntryInItsPlace) {
  const auto wrapper = pack({{FileDiff::Added{"a/b/new", data}},
                             {FileDiff::Modified{"a/text.swift", {{{12, 3}, {12, 0}, u"\u00e4\r\n", u""}}}},
                             {FileDiff::Removed{"../gone"}},
                             {FileDiff::Added{"z", data}},
                             {FileDiff::Replaced{"a/b/image", data}}})
                           .fileWrapper();
  EXPECT_FALSE(wrapper.preferredFilename());
  const auto text = [](const PropertyListValue& value) { return description(value); };
  EXPECT_EQ(
      files(wrapper),
      (std::map<std::string, std::string>{
          {manifest, text(D{{"DiffPackType", "UserEdit"},
                            {"DocumentType", "MarletBook"},
                            {"Name", "name"},
                            {"BaseVersion", "1.0"},
                            {"UpdateVersion", "1.0"},
                            {"Updates", D{{"Added", A{entry("a/b/new"), entry("z")}},
                                          {"Removed", A{entry("../gone")}},
                                          {"Replaced", A{entry("a/b/image")}},
                                          {"Modified", A{entry("a/text.swift", "a/text.swift.delta")}}}}})},
          {"a/b/new", "data"},
          {"z", "data"},
          {"a/b/image", "data"},
          {"a/text.swift.delta", text(D{{"File", "a/text.swift"},
                                        {"Diff", A{D{{"OriginalRange", "{12, 3}"},
                                                     {"ModifiedRange", "{12, 0}"},
                                                     {"OriginalContent", "\u00e4\r\n"},
                                                     {"ModifiedContent", ""}}}}})},
      }));
  EXPECT_EQ(files(pack({}).fileWrapper()).at(manifest),
            text(D{{"DiffPackType", "UserEdit"},
                   {"DocumentType", "MarletBook"},
                   {"Name", "name"},
                   {"BaseVersion", "1.0"},
                   {"UpdateVersion", "1.0"},
                   {"Updates", D{{"Added", A{}}, {"Removed", A{}}, {"Replaced", A{}}, {"Modified", A{}}}}}));
}

TEST(DiffPackWriting, ReadsBackAsItWas) {
  const std::vector<FileDiff> updates = {
      {FileDiff::Added{"a/new", Data()}},
      {FileDiff::Modified{"Seite \u00fc.swift",
                          {{{0, 4}, {0, 2}, u"a\r\nb", u"\r\t"}, {{9, 0}, {7, 3}, u"", u" \U0001F600"}}}},
      {FileDiff::Modified{"a/empty", {}}},
      {FileDiff::Removed{"old"}},
      {FileDiff::Replaced{"a/image", Data(std::string("\0\xff", 2))}}};
  const auto url = URL::file("/content", true);
  const auto wrapper = pack(updates).fileWrapper();
  const TemporaryDirectory directory;
  wrapper.write(directory.url("P.diffpack"));
  for (const auto& tree : {wrapper, FileWrapper(directory.url("P.diffpack"))}) {
    const DiffPackSnapshot back(tree, url);
    EXPECT_EQ(entries(back), updates);
    EXPECT_EQ(back.description(), pack(updates).description());
    EXPECT_EQ(back.contentUrl, url);
  }
}

TEST(DiffPackWriting, TakesFilesWithoutDataFromTheContent) {
  const TemporaryDirectory directory;
  Tree{{"Contents/a/new.txt", std::string("from disk")}, {"secret", std::string("secret")}}.writeTo(
      directory.path());
  const auto contents = directory.path() / "Contents";
  std::filesystem::create_symlink("../secret", contents / "link");
  std::filesystem::create_directory_symlink("..", contents / "up");
  const auto content = directory.url("Contents");

  EXPECT_EQ(
      files(pack({{FileDiff::Added{"a/new.txt"}}, {FileDiff::Replaced{"a/new.txt"}}}, content).fileWrapper())
          .at("a/new.txt"),
      "from disk");
  const auto posix = [](int code) { return "POSIX " + std::to_string(code); };
  const std::pair<FileDiff, std::string> cases[] = {
      {{FileDiff::Added{"missing"}}, posix(ENOENT)},
      {{FileDiff::Replaced{"a/new.txt/x"}}, posix(ENOENT)},
      {{FileDiff::Added{"../secret"}}, posix(EINVAL)},
      {{FileDiff::Added{directory.path() / "secret"}}, posix(EINVAL)},
      {{FileDiff::Added{"link"}}, posix(EINVAL)},
      {{FileDiff::Added{"up/secret"}}, posix(ENOENT)},
  };
  for (const auto& [update, failure] : cases) EXPECT_EQ(written(pack({update}, content)), failure);
  EXPECT_EQ(written(pack({{FileDiff::Added{"a"}}}, directory.url("Nowhere"))), posix(ENOENT));
}

TEST(DiffPackWriting, NeverWritesOutsideOrIllFormed) {
  const auto posix = [](int code) { return "POSIX " + std::to_string(code); };
  const std::pair<std::vector<FileDiff>, std::string> cases[] = {
      {{{FileDiff::Added{"../x", data}}}, posix(EINVAL)},
      {{{FileDiff::Added{"a/../../x", data}}}, posix(EINVAL)},
      {{{FileDiff::Replaced{"/x", data}}}, posix(EINVAL)},
      {{{FileDiff::Replaced{"", data}}}, posix(EINVAL)},
      {{{FileDiff::Replaced{std::string("a\0b", 3), data}}}, posix(EINVAL)},
      {{{FileDiff::Modified{"../x"}}}, posix(EINVAL)},
      {{{FileDiff::Modified{"a", {{{}, {}, u"", {char16_t{0xD83D}}}}}}}, posix(EILSEQ)},
      // A file gives way to a directory of its name, and the manifest gives way to nothing.
      {{{FileDiff::Added{"a", data}}, {FileDiff::Added{"a/b", data}}}, "Manifest.plist a/b "},
      {{{FileDiff::Added{"Manifest.plist/b", data}}}, "Manifest.plist "},
      {{{FileDiff::Modified{"a//b/"}}}, "Manifest.plist a/b.delta "},
  };
  for (const auto& [updates, result] : cases) EXPECT_EQ(written(pack(updates)), result);
}

}  // namespace
}  // namespace MarletFoundation::test
