#include <gtest/gtest.h>

#include "DiffPack/Packs.h"
#include "MarletFoundation/DiffPack/PartialDiffPack.h"
#include "MarletFoundation/Platform/PropertyListError.h"
#include "support/Failure.h"

namespace MarletFoundation::test {
namespace {

const URL contentUrl = URL::file("/books/Loops.marletbook/Contents", true);
const std::string notAPlist = "<plist><oops></plist>";

/// What reading a tree comes to: the pack, or a diff pack error's words, or another error's domain.
std::variant<DiffPackSnapshot, std::string> outcome(const FileWrapper& wrapper) {
  try {
    return DiffPackSnapshot(wrapper, contentUrl);
  } catch (const ErrorObject& error) {
    if (error.domain() == "Diff" && error.code() == 3) return error.localizedDescription();
    return std::string(error.domain());
  }
}

/// Reads a tree from memory and from disk, which come to the same.
std::variant<DiffPackSnapshot, std::string> outcome(const Tree& tree) {
  const TemporaryDirectory directory;
  tree.writeTo(directory.path());
  auto fromMemory = outcome(tree.wrapper());
  const auto fromDisk = outcome(FileWrapper(directory.url()));
  EXPECT_EQ(fromMemory.index(), fromDisk.index()) << tree;
  if (const auto* pack = std::get_if<0>(&fromMemory)) {
    EXPECT_EQ(entries(*pack), entries(std::get<0>(fromDisk))) << tree;
  } else {
    EXPECT_EQ(std::get<1>(fromMemory), std::get<1>(fromDisk)) << tree;
  }
  return fromMemory;
}

DiffPackSnapshot opened(const Tree& tree) {
  const auto result = outcome(tree);
  if (const auto* words = std::get_if<std::string>(&result)) throw std::runtime_error(*words);
  return std::get<0>(result);
}

std::string failure(const Tree& tree) {
  const auto result = outcome(tree);
  const auto* words = std::get_if<std::string>(&result);
  return words ? *words : "opened";
}

Tree withUpdates(D updates) { return goodPack().withKey(manifest, "Updates", std::move(updates)); }
Tree withHunks(A hunks) { return goodPack().withKey(delta, "Diff", std::move(hunks)); }
Tree withHunkKey(std::string_view key, std::optional<PropertyListValue> value) {
  auto entry = std::get<D>(hunkEntry().payload);
  entry.erase(key);
  if (value) entry[key] = *value;
  return withHunks({hunkEntry(), entry});
}

TEST(DiffPackReading, ReadsEveryKindOfEntry) {
  const auto pack = opened(goodPack());
  EXPECT_EQ(pack.diffPackType, DiffPackType::UserEditPack);
  EXPECT_EQ(pack.contentUrl, contentUrl);
  EXPECT_EQ(pack.description(), "MarletBook UserEdit, org.example.loops 1.0 -> 1.0.1");
  EXPECT_EQ(entries(pack), (std::vector<FileDiff>{
                               {FileDiff::Added{"new.txt", Data(std::string("new"))}},
                               {FileDiff::Modified{"Pages/text.swift", {{{2, 3}, {2, 4}, u"one", u"zwei"}}}},
                               {FileDiff::Removed{"old.txt"}},
                               {FileDiff::Replaced{"Pages/image.png", Data(std::string("\x89PNG"))}},
                           }));
  const auto update = opened(goodPack()
                                 .withKey(manifest, "DiffPackType", "Update")
                                 .withKey(manifest, "UpdateVersion", "1.0")
                                 .without("new.txt")
                                 .without("Pages/image.png"));
  EXPECT_EQ(update.description(), "MarletBook Update, org.example.loops 1.0");
  EXPECT_EQ(update.updates[0], (FileDiff{FileDiff::Added{"new.txt"}}));
  EXPECT_EQ(update.updates[3], (FileDiff{FileDiff::Replaced{"Pages/image.png"}}));
}

TEST(DiffPackReading, FailsInTheWordsOfEachCheck) {
  const auto good = goodPack();
  const std::string entryWords = "Invalid Manifest.plist, encountered invalid update entry";
  const auto deltaWords = [](const std::string& what, const std::string& path = delta) {
    return "Invalid Diff Pack, " + what + " " + path;
  };
  const auto key = [&](std::string_view name, PropertyListValue value) {
    return good.withKey(manifest, name, std::move(value));
  };
  const std::pair<Tree, std::string> cases[] = {
      {good.without(manifest), "Invalid diffpack format, missing Manifest.plist"},
      {good.without(manifest).with(manifest + "/", std::string()),
       "Invalid diffpack format, missing Manifest.plist"},
      {good.with(manifest, notAPlist), "Invalid Manifest.plist format"},
      {good.with(manifest, std::string()), "Invalid Manifest.plist format"},
      {good.with(manifest, PropertyListValue(A{})),
       "Invalid Manifest.plist format, manifest root is not a dictionary"},
      {good.withoutKey(manifest, "DiffPackType"), "Invalid Manifest.plist DiffPackType entry: nil"},
      {key("DiffPackType", "update"),
       "Invalid Manifest.plist DiffPackType entry: Optional(string(\"update\"))"},
      {key("DiffPackType", 1), "Invalid Manifest.plist DiffPackType entry: Optional(integer(1))"},
      {good.withoutKey(manifest, "DocumentType"), "Invalid Manifest.plist DocumentType entry: nil"},
      {key("DocumentType", "Marlet"),
       "Invalid Manifest.plist DocumentType entry: Optional(string(\"Marlet\"))"},
      {key("Name", 1), "Invalid Manifest.plist, missing Name entry"},
      {good.withoutKey(manifest, "BaseVersion"), "Invalid Manifest.plist, missing BaseVersion entry"},
      {key("UpdateVersion", 1.5), "Invalid Manifest.plist, missing UpdateVersion entry"},
      {key("Updates", A{}), "Invalid Manifest.plist, missing Updates entry"},

      {withUpdates({{"Moved", A{}}}), entryWords},
      {withUpdates({{"Removed", D{}}}), entryWords},
      {withUpdates({{"Removed", A{D{}}}}), entryWords},
      {withUpdates({{"Removed", A{D{{"File", 1}}}}}), entryWords},
      {withUpdates({{"Modified", A{D{{"Diff", delta}}}}}), entryWords},
      {withUpdates({{"Modified", A{D{{"File", "a"}, {"Diff", 1}}}}}), entryWords},
      {withUpdates({{"Modified", A{entry("a")}}}), entryWords},

      {good.without("new.txt"), "Invalid Diff Pack, missing  file new.txt"},
      {good.without("Pages/image.png"), "Invalid Diff Pack, missing  file Pages/image.png"},
      {good.without("new.txt").with("new.txt/", std::string()), "Invalid Diff Pack, missing  file new.txt"},
      {withUpdates({{"Added", A{entry("")}}}), "Invalid Diff Pack, missing  file "},
      {withUpdates({{"Added", A{entry("new.txt/x")}}}), "Invalid Diff Pack, missing  file new.txt/x"},
      {withUpdates({{"Added", A{entry("/new.txt")}}}), "Invalid Diff Pack, missing  file /new.txt"},
      {withUpdates({{"Added", A{entry("../new.txt")}}}), "Invalid Diff Pack, missing  file ../new.txt"},
      {withUpdates({{"Added", A{entry("Pages/../new.txt")}}}),
       "Invalid Diff Pack, missing  file Pages/../new.txt"},

      {good.without(delta), deltaWords("missing .delta file")},
      {good.without("Pages").with("Pages/image.png", std::string()), deltaWords("missing .delta file")},
      {withUpdates({{"Modified", A{entry("a", "Pages")}}}), deltaWords("missing .delta file", "Pages")},
      {good.with(delta, notAPlist), std::string(PropertyListErrorDomain)},
      {good.with(delta, PropertyListValue(A{})), deltaWords("invalid .delta file")},
      {good.withoutKey(delta, "Diff"), deltaWords("invalid .delta file")},
      {good.withKey(delta, "Diff", D{}), deltaWords("invalid .delta file")},
      {withHunks({1}), deltaWords("encountered invalid .delta file entry")},
      {withHunks({hunkEntry(), D{}}), deltaWords("encountered invalid .delta file entry")},
      {withHunkKey("OriginalRange", std::nullopt), deltaWords("encountered invalid .delta file entry")},
      {withHunkKey("ModifiedRange", 1), deltaWords("encountered invalid .delta file entry")},
      {withHunkKey("OriginalContent", A{}), deltaWords("encountered invalid .delta file entry")},
      {withHunkKey("ModifiedContent", std::nullopt), deltaWords("encountered invalid .delta file entry")},
  };
  for (const auto& [tree, words] : cases) EXPECT_EQ(failure(tree), words) << tree;

  EXPECT_EQ(std::get<1>(outcome(FileWrapper::regularFile(Data()))),
            "Invalid diffpack format, no directory contents.");
}

/// What of a pack can't be read is told by its paths; what it doesn't tell ends the reading.
TEST(DiffPackReading, TellsWhatOfADamagedPackCantBeRead) {
  const auto good = goodPack();
  const std::pair<Tree, std::string> cases[] = {
      {good, ""},
      {good.without("new.txt"), "Added new.txt; "},
      {good.without("new.txt").with("new.txt/", std::string()), "Added new.txt; "},
      {good.without("Pages/image.png").without("new.txt"), "Added new.txt; Replaced Pages/image.png; "},
      {good.without(delta), "Modified Pages/text.swift; "},
      {good.with(delta, notAPlist), "Modified Pages/text.swift; "},
      {withHunks({hunkEntry(), D{}}), "Modified Pages/text.swift; "},
      {good.without(manifest), "none"},
      {good.with(manifest, notAPlist), "none"},
      {withUpdates({{"Added", A{D{}}}}), "none"},
      {withUpdates({{"Moved", A{}}}), "none"},
  };
  for (const auto& [tree, unreadable] : cases) {
    std::string found;
    try {
      const PartialDiffPack partial(tree.wrapper(), contentUrl);
      for (const auto& entry : partial.unreadable)
        found += std::string(entry.section) + " " + entry.filePath + "; ";
      EXPECT_EQ(partial.pack.updates.size() + partial.unreadable.size(), 4u) << tree;
    } catch (const ErrorObject&) {
      found = "none";
    }
    EXPECT_EQ(found, unreadable) << tree;
  }
}

TEST(DiffPackReading, KeepsTheCauseOfABadManifest) {
  const auto error =
      errorOf([] { DiffPackSnapshot(goodPack().with(manifest, notAPlist).wrapper(), contentUrl); });
  ASSERT_TRUE(error && error->underlyingError());
  EXPECT_EQ(error->underlyingError()->domain(), PropertyListErrorDomain);
}

/// With everything bad from one check on, that check is the one that fails.
TEST(DiffPackReading, ChecksInOrder) {
  struct {
    std::string_view key;
    PropertyListValue bad;
    std::string words;
  } checks[] = {
      {"DiffPackType", 1, "Invalid Manifest.plist DiffPackType entry: Optional(integer(1))"},
      {"DocumentType", 1, "Invalid Manifest.plist DocumentType entry: Optional(integer(1))"},
      {"Name", 1, "Invalid Manifest.plist, missing Name entry"},
      {"BaseVersion", 1, "Invalid Manifest.plist, missing BaseVersion entry"},
      {"UpdateVersion", 1, "Invalid Manifest.plist, missing UpdateVersion entry"},
      {"Updates", D{{"Added", A{D{}}}}, "Invalid Manifest.plist, encountered invalid update entry"},
  };
  auto tree = goodPack();
  for (auto check = std::rbegin(checks); check != std::rend(checks); ++check) {
    tree = tree.withKey(manifest, check->key, check->bad);
    EXPECT_EQ(failure(tree), check->words);
  }
  // The entries of a section in order, and the sections by their names.
  EXPECT_EQ(failure(withUpdates({{"Removed", A{D{}}}, {"Added", A{entry("x"), D{}}}})),
            "Invalid Diff Pack, missing  file x");
  EXPECT_EQ(failure(withUpdates({{"Modified", A{entry("a", "b")}}, {"Zed", A{}}})),
            "Invalid Diff Pack, missing .delta file b");
  EXPECT_EQ(failure(withUpdates({{"Modified", A{D{{"Diff", "b"}}}}})),
            "Invalid Manifest.plist, encountered invalid update entry");
}

TEST(DiffPackReading, ToleratesWhatItNeedNotUnderstand) {
  EXPECT_TRUE(opened(withUpdates({})).updates.empty());
  EXPECT_EQ(opened(withUpdates({{"Removed", A{7, "x", A{}, entry("a")}}})).updates.size(), 1u);
  EXPECT_EQ(opened(goodPack().withKey(manifest, "Zed", 1)).updates.size(), 4u);
  EXPECT_EQ(opened(goodPack().withoutKey(delta, "File")).updates.size(), 4u);
  // A delta lies where the entry says, and any number of entries may name it, each in its way.
  const auto shared = opened(withUpdates(
      {{"Modified", A{entry("a", delta), entry("b", "Pages//text.swift.delta"), entry("a", delta)}}}));
  EXPECT_EQ(shared.updates[1], (FileDiff{FileDiff::Modified{"b", {{{2, 3}, {2, 4}, u"one", u"zwei"}}}}));
  EXPECT_EQ(shared.updates.first("a"), &shared.updates[0]);
  EXPECT_EQ(shared.updates.first("c"), nullptr);
}

TEST(DiffPackReading, RangeStringsAreTheFirstTwoNumbers) {
  constexpr auto largest = std::numeric_limits<std::int64_t>::max();
  const std::pair<std::string, TextRange> cases[] = {
      {"{3, 2}", {3, 2}},
      {"3,2", {3, 2}},
      {"", {0, 0}},
      {"{7}", {7, 0}},
      {"a1b2c3", {1, 2}},
      {"-5 6", {5, 6}},
      {"{,}", {0, 0}},
      {"007 0", {7, 0}},
      {"{9223372036854775807, 9223372036854775808}", {largest, 0}},
      {"{7, 9223372036854775807}", {7, largest - 7}},
      {"99999999999999999999999999 4", {largest, 0}},
  };
  for (const auto& [text, range] : cases) {
    const auto pack = opened(withHunkKey("OriginalRange", text));
    EXPECT_EQ(std::get<FileDiff::Modified>(pack.updates[1].change).diff[1].originalRange, range) << text;
  }
}

}  // namespace
}  // namespace MarletFoundation::test
