#include "MarletFoundation/DiffPack/UpdateDiffPack.h"

#include <gtest/gtest.h>

#include <fstream>

#include "DiffPack/Packs.h"
#include "MarletFoundation/DiffPack/MarletBookDiffMergeContext.h"
#include "MarletFoundation/DiffPack/MergedUserEdit.h"
#include "MarletFoundation/Marlet/MarletBookSnapshot.h"
#include "support/Documents.h"
#include "support/Failure.h"

namespace MarletFoundation::test {
namespace {

namespace fs = std::filesystem;
using namespace std::string_literals;

const std::string page = "Chapters/One.marletchapter/Pages/A.marletpage/Contents.swift";
const std::string bookManifest = "Contents/Manifest.plist";

std::string text(const fs::path& path) {
  std::ifstream stream(path, std::ios::binary);
  return {std::istreambuf_iterator<char>(stream), {}};
}

/// Everything below a directory: paths, and the files' bytes.
std::map<std::string, std::string> snapshotOf(const fs::path& directory) {
  std::map<std::string, std::string> files;
  for (const auto& entry : fs::recursive_directory_iterator(directory)) {
    files[entry.path().lexically_relative(directory)] = entry.is_directory() ? "/" : text(entry.path());
  }
  return files;
}

class UpdateDiffPack : public testing::Test {
 protected:
  URL book(const std::string& name, const Tree& tree) const {
    tree.writeTo(directory_.path() / name);
    return directory_.url(name);
  }
  URL book(const std::string& name, const std::string& version) const {
    return book(name, goodBook().withKey(bookManifest, "ContentVersion", version));
  }
  /// "DOMAIN CODE: WORDS" of what a function throws.
  template <class Function>
  std::string failure(Function function) const {
    const auto error = errorOf(function);
    return error ? std::string(error->domain()) + " " + std::to_string(error->code()) + ": " +
                       ErrorObject(*error).localizedDescription()
                 : "";
  }
  DiffPackSnapshot updatePack(std::vector<FileDiff> updates, const std::string& source = "source") const {
    fs::create_directories(directory_.path() / source);
    return {DiffPackType::UpdatePack, DiffPackDocumentType::MarletBook, directory_.url(source), "x", "7", "9",
            std::move(updates)};
  }

  const TemporaryDirectory directory_;
};

TEST_F(UpdateDiffPack, RefusesInAFixedOrder) {
  const auto make = [&](const URL& a, const URL& b) { return failure([&] { makeUpdateDiffPack(a, b); }); };
  const auto good = book("good.marletbook", "1.0");
  const auto classic = directory_.url("a.marlet"), missing = directory_.url("missing.marletbook");
  EXPECT_EQ(make(classic, directory_.url("b")),
            "Diff 1: Unrecognized document format " + classic.absoluteString());
  EXPECT_EQ(make(missing, classic), "Diff 1: Unrecognized document format " + classic.absoluteString());
  EXPECT_EQ(failure([&] { applyUpdateDiffPack(classic, updatePack({})); }),
            "Diff 1: Unrecognized document format " + classic.absoluteString());

  const auto bad = book("bad.marletbook", goodBook().withoutKey(bookManifest, "Version"));
  EXPECT_EQ(make(good, bad),
            "Diff 2: Unable to load document " + bad.absoluteString() + ", error: missingVersion");
  EXPECT_TRUE(make(missing, bad)
                  .starts_with("Diff 2: Unable to load document " + missing.absoluteString() +
                               ", error: Error(domain: POSIX, code: 2"));
  try {
    makeUpdateDiffPack(good, bad);
  } catch (const ErrorObject& error) {
    EXPECT_EQ(error.underlyingError()->domain(), "MarletFoundation.MarletBookSnapshot.SerializationError");
  }

  const auto other = book("other.marletbook", goodBook()
                                                  .withKey(bookManifest, "ContentVersion", "7")
                                                  .withKey(bookManifest, "ContentIdentifier", "other"));
  EXPECT_EQ(make(good, other),
            "Diff 2: Mismatched Marlet Book content identifier: org.example.loops -> other");
}

TEST_F(UpdateDiffPack, LeadsToTheNextPatchOnly) {
  int number = 0;
  const auto make = [&](const std::string& a, const std::string& b) {
    const auto original = book(std::to_string(++number) + ".marletbook", a);
    const auto updated = book(std::to_string(++number) + ".marletbook", b);
    return failure([&] { makeUpdateDiffPack(original, updated); });
  };
  for (const auto& [a, b] : std::vector<std::pair<std::string, std::string>>{
           {"1.0", "1.0.1"}, {"1.0.0", "1.0.1"}, {"1.0.1", "1.0.2"}, {"1.0.1.9", "1.0.2"}}) {
    EXPECT_EQ(make(a, b), "") << a << " " << b;
  }
  for (const auto& [a, b] :
       std::vector<std::pair<std::string, std::string>>{{"1.0.0", "1.0.2"},
                                                        {"1.0.1", "1.0.1"},
                                                        {"1.0.1", "1.1.0"},
                                                        {"1.0.0", "1.0"},
                                                        {"1", "1.0.1"},
                                                        {"1.0", "2.0.1"},
                                                        {"1.0.9223372036854775807", "1.0.1"}}) {
    EXPECT_EQ(make(a, b), "Diff 2: Invalid Marlet Book content version: " + a + " -> " + b +
                              ". The update must have the same major and minor version, with the next "
                              "sequential patch version, e.g. 1.0.0 -> 1.0.1");
  }
}

TEST_F(UpdateDiffPack, ItsApplicationMakesTheUpdatedContents) {
  const auto base = goodBook().withKey(bookManifest, "ContentVersion", "1.2");
  const auto next = goodBook()
                        .withKey(bookManifest, "ContentVersion", "1.2.1")
                        .with("Contents/" + page, "print(1)\nprint(2)\n")
                        .with("Contents/Resources/cover.png", "\xff\xfe")
                        .with("Contents/Resources/more/new.png", "new");
  const auto original = book("base.marletbook", base), updated = book("next.marletbook", next);
  const auto pack = makeUpdateDiffPack(original, updated);
  EXPECT_EQ(pack.description(), "MarletBook Update, org.example.loops 1.2 -> 1.2.1");
  EXPECT_EQ(pack.contentUrl, updated.appendingPathComponent("Contents", true));
  pack.fileWrapper().write(directory_.url("u.diffpack"));
  const auto packUrl = directory_.url("u.diffpack");
  applyUpdateDiffPack(original, DiffPackSnapshot(FileWrapper(packUrl), packUrl));
  EXPECT_EQ(snapshotOf(directory_.path() / "base.marletbook"),
            snapshotOf(directory_.path() / "next.marletbook"));
}

TEST_F(UpdateDiffPack, MergeFailsInAFixedOrderAndChangesNothing) {
  const auto url = book("b.marletbook", goodBook().with("Contents/latin", "\xe4"));
  const auto before = snapshotOf(directory_.path());
  const auto merge = [&](const URL& at, const DiffPackSnapshot& pack) {
    return failure([&] { MarletBookDiffMergeContext(at).mergeDiffPack(pack); });
  };
  EXPECT_TRUE(merge(directory_.url("none"), updatePack({})).starts_with("POSIX 2: "));
  const auto empty = book("empty", Tree{{"Edits", "not even a directory"}});
  EXPECT_EQ(merge(empty, updatePack({})), "Diff 1: Marlet Book has no Contents directory");
  EXPECT_EQ(merge(directory_.url("empty/Edits"), updatePack({})),
            "Diff 1: Marlet Book has no Contents directory");
  const auto bad = book("bad", goodBook().withoutKey(bookManifest, "Version"));
  EXPECT_TRUE(
      merge(bad, updatePack({}, "gone")).starts_with("MarletFoundation.MarletBookSnapshot.Serialization"));
  auto noSource = updatePack({{FileDiff::Modified{"nowhere"}}}, "away");
  fs::remove(directory_.path() / "away");
  EXPECT_TRUE(merge(url, noSource).starts_with("POSIX 2: "));

  fs::create_symlink("/etc", directory_.path() / "source/etc");
  for (const auto& path : {"nowhere", "a/../nowhere", "../secret", "/etc/passwd", "etc/passwd", "."}) {
    const auto missing = "Diff 1: Missing file "s + path;
    EXPECT_EQ(merge(url, updatePack({{FileDiff::Modified{path}}})), missing);
    EXPECT_EQ(merge(url, updatePack({{FileDiff::Added{path, Data("its own"s)}}})), missing);
    EXPECT_EQ(merge(url, updatePack({{FileDiff::Replaced{path}}})), missing);
  }
  EXPECT_EQ(merge(url, updatePack({{FileDiff::Modified{"latin"}}})), "Diff 1: Missing file latin");
  EXPECT_EQ(merge(url, updatePack({{FileDiff::Modified{"Resources"}}})), "Diff 1: Missing file Resources");
  EXPECT_TRUE(merge(url, updatePack({{FileDiff::Modified{page, {{{0, 1}, {}, u"x", u"y"}}}}}))
                  .starts_with("MarletDiff 4: "));
  EXPECT_TRUE(merge(url, updatePack({{FileDiff::Modified{page, {{{0, 0}, {}, u"", u"\xD800"}}}}}))
                  .starts_with("POSIX " + std::to_string(EILSEQ) + ": "));
  for (const auto& [path, contents] : before) {
    EXPECT_EQ(snapshotOf(directory_.path()).at(path), contents) << path;
  }
}

TEST_F(UpdateDiffPack, AddsReplacesAndRemoves) {
  const auto url = book("b.marletbook", goodBook().with("notes.txt", "at the top"));
  Tree{{"source/Sources/Shared.swift", "replaced"s},
       {"source/deep/er/new", "added"s},
       {"source/Resources/cover.png/inside", "below a file"s}}
      .writeTo(directory_.path());
  MarletBookDiffMergeContext(url).mergeDiffPack(
      updatePack({{FileDiff::Removed{"Chapters/Two.marletchapter/Manifest.plist"}},
                  {FileDiff::Removed{"notes.txt"}},
                  {FileDiff::Removed{"none/such"}},
                  {FileDiff::Removed{"../source/deep"}},
                  {FileDiff::Removed{""}},
                  {FileDiff::Replaced{"Sources/Shared.swift", Data("not looked at"s)}},
                  {FileDiff::Added{"deep/er/new"}},
                  {FileDiff::Added{"Resources/cover.png/inside"}}}));
  const auto contents = directory_.path() / "b.marletbook/Contents";
  // Removed files go by the document's root.
  EXPECT_TRUE(fs::exists(contents / "Chapters/Two.marletchapter/Manifest.plist"));
  EXPECT_FALSE(fs::exists(directory_.path() / "b.marletbook/notes.txt"));
  EXPECT_TRUE(fs::exists(directory_.path() / "source/deep/er/new"));
  EXPECT_EQ(text(contents / "Sources/Shared.swift"), "replaced");
  EXPECT_EQ(text(contents / "deep/er/new"), "added");
  EXPECT_EQ(text(contents / "Resources/cover.png/inside"), "below a file");
  EXPECT_FALSE(fs::exists(directory_.path() / "b.marletbook/Edits/UserEdits.diffpack"));
}

class RebasingUserEdits : public UpdateDiffPack {
 protected:
  /// Applies hunks to the page "one two\nthree\n" of a learner who wrote "3" for "three".
  std::string rebased(MarletDiff::DiffDescriptors update, std::vector<FileDiff> edits) {
    const auto url = book("b.marletbook", goodBook().with("Contents/" + page, "one two\nthree\n"));
    const DiffPackSnapshot pack(DiffPackType::UserEditPack, DiffPackDocumentType::MarletBook, url, "loops",
                                "1.2", "1.2", std::move(edits));
    pack.fileWrapper().write(directory_.url("b.marletbook/Edits/UserEdits.diffpack"));
    MarletBookDiffMergeContext(url).mergeDiffPack(
        updatePack({{FileDiff::Modified{page, std::move(update)}}}));
    MarletBookSnapshot(FileWrapper(url), url, pack_);
    const auto seen = mergedUserEdit(*pack_, page);
    return seen ? std::string(seen->view()) : "absent";
  }
  std::optional<DiffPackSnapshot> pack_;
};

TEST_F(RebasingUserEdits, CarriesTheEditOverToTheNewText) {
  const FileDiff edit{FileDiff::Modified{page, {{{8, 5}, {}, u"three", u"3"}}}};
  EXPECT_EQ(rebased({{{0, 0}, {}, u"", u"zero\n"}}, {edit}), "zero\none two\n3\n");
  EXPECT_EQ(pack_->description(), "MarletBook UserEdit, loops 9");
  EXPECT_EQ(entries(*pack_),
            (std::vector<FileDiff>{{FileDiff::Modified{page, {{{13, 5}, {13, 1}, u"three", u"3"}}}}}));
  // The same change on both sides leaves an entry without hunks.
  EXPECT_EQ(rebased({{{8, 5}, {}, u"three", u"3"}}, {edit}), "one two\n3\n");
  EXPECT_EQ(entries(*pack_), (std::vector<FileDiff>{{FileDiff::Modified{page}}}));
  // Any other entry stays, and only the first of a path counts.
  const FileDiff replaced{FileDiff::Replaced{page, Data("mine"s)}};
  EXPECT_EQ(rebased({{{0, 3}, {}, u"one", u"1"}}, {replaced}), "mine");
  EXPECT_EQ(rebased({}, {{FileDiff::Removed{page}}}), "absent");
}

TEST_F(RebasingUserEdits, AConflictChangesNothing) {
  EXPECT_THROW(
      rebased({{{8, 5}, {}, u"three", u"III"}}, {{FileDiff::Modified{page, {{{8, 5}, {}, u"three", u"3"}}}}}),
      ErrorObject);
  EXPECT_EQ(text(directory_.path() / "b.marletbook/Contents" / page), "one two\nthree\n");
  const auto url = directory_.url("b.marletbook");
  MarletBookSnapshot(FileWrapper(url), url, pack_);
  EXPECT_EQ(pack_->description(), "MarletBook UserEdit, loops 1.2");
  EXPECT_NO_THROW(MarletBookDiffMergeContext(url).validateDiffPack(*pack_));
}

}  // namespace
}  // namespace MarletFoundation::test
