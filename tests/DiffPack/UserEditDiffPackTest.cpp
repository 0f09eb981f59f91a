#include "MarletFoundation/DiffPack/UserEditDiffPack.h"

#include <gtest/gtest.h>
#include <rapidcheck/gtest.h>

#include <numeric>

#include "DiffPack/Packs.h"
#include "MarletDiff/ContentDiff.h"
#include "MarletDiff/Texts.h"
#include "MarletFoundation/DiffPack/CheckedDiffPack.h"
#include "MarletFoundation/DiffPack/MergedUserEdit.h"
#include "MarletFoundation/DiffPack/UserEditDiffPackValidator.h"
#include "MarletFoundation/DiffPack/UserEditsPlace.h"
#include "MarletFoundation/Marlet/MarletBookSnapshot.h"
#include "MarletFoundation/Platform/FileManager.h"
#include "MarletFoundation/SourceAnnotations/EditableRanges.h"
#include "MarletFoundation/SourceAnnotations/SourceTag.h"
#include "support/Documents.h"
#include "support/Failure.h"
#include "support/Fatal.h"

namespace MarletFoundation::test {
namespace {

using namespace std::string_literals;
using MarletDiff::DiffDescriptor;

const std::string field = "//#-editable-code\nfirst\nsecond\n//#-end-editable-code\n";
const std::string source = "let fixed = 1\n" + field + "fixed()\n";

DiffPackSnapshot packOf(const URL& contentUrl, std::vector<FileDiff> updates = {}) {
  return {DiffPackType::UserEditPack, DiffPackDocumentType::MarletBook, contentUrl, "id", "1.0", "1.0",
          std::move(updates)};
}

std::string replacing(std::string text, const std::string& what, const std::string& with) {
  return text.replace(text.find(what), what.size(), with);
}

TEST(UserEditDiffPack, IsEmptyAndOfTheBooksVersionAtFirst) {
  const TemporaryDirectory directory;
  goodBook().writeTo(directory.path());
  const MarletBookSnapshot book(FileWrapper(directory.url()), directory.url());
  const auto pack = makeUserEditDiffPack(book, directory.url("Contents"));
  EXPECT_EQ(pack.description(), "MarletBook UserEdit, org.example.loops 1.2");
  EXPECT_EQ(pack.contentUrl, directory.url("Contents"));
  EXPECT_TRUE(pack.updates.empty());
}

TEST(UserEditDiffPack, OnlyAValidPackIsUpdated) {
  const auto url = URL::file("/nowhere");
  const DiffPackSnapshot update(DiffPackType::UpdatePack, DiffPackDocumentType::MarletBook, url, "id", "1",
                                "1", {});
  const DiffPackSnapshot moving(DiffPackType::UserEditPack, DiffPackDocumentType::MarletBook, url, "id", "1",
                                "1.0", {});
  for (const auto& pack : {update, moving}) {
    EXPECT_EQ(failure([&] { updatedUserEditDiffPack(pack, {}); }),
              R"(Error(domain: Diff, code: 5, "Invalid user-edit DiffPack"))");
  }
  EXPECT_NO_THROW(UserEditDiffPackValidator(packOf(url)).validate());
}

/// What becomes of a hunk over one range, given the text.
bool survives(std::u16string_view content, TextRange range) {
  const UserEditDiffPackValidator validator(packOf(URL::file("/nowhere")));
  const auto kept = validator.validatedUpdate({FileDiff::Modified{"p", {{range, {}, u"", u""}}}}, content);
  return kept.has_value();
}

TEST(UserEditDiffPack, AHunkStaysWhenItLiesWhollyInOneEditableRange) {
  const std::u16string text(source.begin(), source.end());
  const auto start = static_cast<std::int64_t>(text.find(u"first"));
  const auto end = static_cast<std::int64_t>(text.find(u"//#-end"));
  const std::vector<std::pair<TextRange, bool>> cases = {{{start, 0}, true},
                                                         {{end, 0}, true},
                                                         {{start - 1, 0}, false},
                                                         {{end + 1, 0}, false},
                                                         {{start, end - start}, true},
                                                         {{start - 1, 2}, false},
                                                         {{end - 1, 1}, true},
                                                         {{end - 1, 2}, false},
                                                         {{0, 3}, false}};
  for (const auto& [range, stays] : cases) {
    EXPECT_EQ(survives(text, range), stays) << range.location << " " << range.length;
  }
  constexpr auto largest = std::numeric_limits<std::int64_t>::max();
  for (const TextRange& range :
       {TextRange{start, largest}, {largest, 1}, {largest, largest}, {end, -1}, {-1, 1}})
    EXPECT_FALSE(survives(text, range)) << range.location << " " << range.length;
  EXPECT_TRUE(survives(u"no tags", {0, 7}));
  EXPECT_FALSE(survives(u"no tags", {0, 8}));

  const UserEditDiffPackValidator validator(packOf(URL::file("/nowhere")));
  const std::vector<DiffDescriptor> hunks{
      {{end, 0}, {}, u"", u"b"}, {{0, 1}, {}, u"l", u"m"}, {{start, 0}, {}, u"", u"a"}};
  EXPECT_EQ(validator.validatedUpdate({FileDiff::Modified{"p", hunks}}, text),
            (FileDiff{FileDiff::Modified{"p", {hunks[0], hunks[2]}}}));
  for (const auto& entry : {FileDiff{FileDiff::Added{"p"}}, FileDiff{FileDiff::Removed{"p"}},
                            FileDiff{FileDiff::Replaced{"p", Data("x"s)}}}) {
    EXPECT_EQ(validator.validatedUpdate(entry), entry);
  }
  EXPECT_NE(fatalMessage([&] { validator.validatedUpdate({FileDiff::Modified{"p"}}); }), "");
}

class UpdatingUserEdits : public testing::Test {
 protected:
  UpdatingUserEdits() {
    Tree{{"page", source}, {"bare", "one\ntwo"s}, {"binary", "\xff"s}, {"crlf", "a\r\n"s}}.writeTo(
        directory_.path());
  }

  std::vector<FileDiff> updated(const UserEdits& edits, std::vector<FileDiff> before = {}) const {
    return entries(updatedUserEditDiffPack(packOf(directory_.url(), std::move(before)), edits));
  }
  /// The file as the learner sees it after an edit.
  std::string seen(const std::string& path, const std::string& edited) const {
    const auto pack = updatedUserEditDiffPack(packOf(directory_.url()), {{path, Data(edited)}});
    return std::string(mergedUserEdit(pack, path)->view());
  }

  const TemporaryDirectory directory_;
};

TEST_F(UpdatingUserEdits, KeepsWhatIsEditableOfATextAndDropsTheRest) {
  const auto edited = replacing(source, "second", "2nd");
  EXPECT_EQ(seen("page", edited), edited);
  EXPECT_EQ(seen("page", replacing(edited, "fixed()", "broken()")), edited);
  EXPECT_TRUE(updated({{"page", Data(replacing(source, "fixed()", "broken()"))}}).empty());
  EXPECT_EQ(seen("bare", "three\ntwo"), "three\ntwo");
  // A learner's slashes ahead of the end tag are the learner's.
  const auto slashes = replacing(source, "second\n", "second\n//\n//\n////\n");
  EXPECT_EQ(seen("page", slashes), slashes);
}

TEST_F(UpdatingUserEdits, KeepsWhatIsWrittenBetweenTheQuotesOfAField) {
  const auto page = [](const std::string& written) {
    return "let s = /*#-editable-code*/\"" + written + "\"/*#-end-editable-code*/\n";
  };
  const std::vector<std::string> texts = {
      "", "\"", "x", "\"x\"", R"(\"x\")", R"(x" + name + "!)", R"(a" + "x)", R"(\(names["x"]))"};
  for (const auto& original : texts) {
    Tree{{"quoted", page(original)}}.writeTo(directory_.path());
    for (const auto& written : texts) EXPECT_EQ(seen("quoted", page(written)), page(written)) << original;
  }
}

RC_GTEST_FIXTURE_PROP(UpdatingUserEdits, LosesNothingThatIsWrittenInFields, ()) {
  const auto anyText =
      rc::gen::map(rc::gen::container<std::vector<std::string>>(rc::gen::element<std::string>(
                       "a", " ", "\n", "\"", "/", "*", "//#-", "//#-end-editable-code\n",
                       "/*#-end-editable-code*/", "//#-editable-code\n", "/*#-editable-code*/", "let x")),
                   [](const std::vector<std::string>& pieces) {
                     return std::accumulate(pieces.begin(), pieces.end(), std::string());
                   });
  const auto page = [&](const std::string& one, const std::string& two, const std::string& three) {
    return "a\n//#-editable-code\n" + one + "//#-end-editable-code\nb\nf(/*#-editable-code*/\"" + two +
           "\"/*#-end-editable-code*/)\n//#-editable-code\n" + three + "//#-end-editable-code\n";
  };
  Tree{{"fields", page("x\ny\n", "x y", "\n")}}.writeTo(directory_.path());
  const auto edited = page(*anyText, *anyText, *anyText);
  RC_ASSERT(seen("fields", edited) == edited);
}

/// Whether a range takes in a part of a page's tag or line of a tag, or lies within.
bool touchesTag(std::u16string_view text, const TextRange& range) {
  const auto tags = SourceTag::parseLineForTagsInSourceEditor(text);
  return std::any_of(tags.begin(), tags.end(), [&](const SourceTag::Located& located) {
    const auto tagEnd = located.range.end() + (located.tag.isLineTag() ? 1 : 0);
    return located.range.location < range.end() && range.location < tagEnd;
  });
}

/// The editable range of a field reaches over the tags of fields within it.
RC_GTEST_FIXTURE_PROP(UpdatingUserEdits, LeavesTagsAsTheyAreInFieldsWithinFields, ()) {
  const auto page = textOf(
      {u"a\n", u"\u00e9/\n", u"//#-editable-code\n", u"//#-editable-code\n", u"//#-end-editable-code\n",
       u"//#-end-editable-code\n", u"//#-hidden-code\n", u"//#-end-hidden-code\n", u"//#-copy-source(id)\n",
       u"//#-end-copy-source\n", u"/*#-copy-source(i)*/c/*#-end-copy-source*/ d\n",
       u"f(/*#-editable-code*/1/*#-end-editable-code*/, /*#-editable-code*/x/*#-end-editable-code*/)\n"});
  const auto writing = textOf({u"a", u"/", u"*/", u"//#-", u"\n", u"b()\n", u"/*#-end-editable-code*/",
                               u"/*#-editable-code*/", u"//#-end-editable-code\n", u"//#-editable-code\n"});
  const auto utf8 = [](std::u16string_view text) { return *utf8FromUTF16(text); };
  const auto text = u"x\n" + *page;
  Tree{{"nested", utf8(text)}}.writeTo(directory_.path());

  auto edited = text;
  const auto range = *rc::gen::elementOf(editableRanges(text));
  RC_PRE(range.length >= 0);
  const auto start = *rc::gen::inRange(range.location, range.end() + 1);
  const auto length = *rc::gen::inRange<std::int64_t>(0, std::min<std::int64_t>(range.end() - start, 9) + 1);
  RC_PRE(!touchesTag(text, {start, length}));
  edited.replace(static_cast<std::size_t>(start), static_cast<std::size_t>(length), *writing);
  RC_ASSERT(seen("nested", utf8(edited)) == utf8(edited));

  // What else is changed, tags included, is no reason to touch a tag.
  edited.replace(*rc::gen::inRange<std::size_t>(0, edited.size() + 1), *rc::gen::inRange<std::size_t>(0, 40),
                 *writing);
  for (const auto& entry : updated({{"nested", Data(utf8(edited))}})) {
    for (const auto& hunk : std::get<FileDiff::Modified>(entry.change).diff)
      RC_ASSERT(!touchesTag(text, hunk.originalRange));
  }
}

TEST_F(UpdatingUserEdits, ALineFeedThatTheEditorAddsIsNoEdit) {
  EXPECT_TRUE(updated({{"bare", Data("one\ntwo\n"s)}}).empty());
  EXPECT_EQ(seen("bare", "one\ntwo\n\n"), "one\ntwo\n");
  EXPECT_EQ(seen("bare", "one\ntwo\r\n"), "one\ntwo\r\n");
  EXPECT_EQ(seen("crlf", "a\r\n\n"), "a\r\n");
  const std::string shorter = "a";
  EXPECT_EQ(seen("crlf", shorter), shorter);
}

TEST_F(UpdatingUserEdits, CarriesWholeWhatIsNoText) {
  const Data text("text"s), bytes("\xfe"s);
  EXPECT_EQ(updated({{"page", bytes}, {"binary", text}, {"new", text}, {"../out", text}}),
            (std::vector<FileDiff>{{FileDiff::Added{"../out", text}},
                                   {FileDiff::Replaced{"binary", text}},
                                   {FileDiff::Added{"new", text}},
                                   {FileDiff::Replaced{"page", bytes}}}));
}

/// One change with a character that XML has none for must not keep the call's others from being saved.
TEST_F(UpdatingUserEdits, CarriesWholeATextWhoseChangesADeltaCantHold) {
  Tree{{"feed", "a\fb\n"s}}.writeTo(directory_.path());
  for (const auto& written : {"\f"s, "\x1b[0m"s, "\xef\xbf\xbe"s, "\0"s}) {
    const auto edited = replacing(source, "second", written);
    const auto pack = updatedUserEditDiffPack(
        packOf(directory_.url()),
        {{"page", Data(replacing(edited, "fixed()", "broken()"))}, {"bare", Data("1"s)}});
    EXPECT_EQ(entries(pack).back(), (FileDiff{FileDiff::Replaced{"page", Data(edited)}}));
    const DiffPackSnapshot saved(checkedFileWrapper(pack), directory_.url());
    EXPECT_EQ(mergedUserEdit(saved, "page")->view(), edited);
    EXPECT_EQ(mergedUserEdit(saved, "bare")->view(), "1");
  }
  EXPECT_EQ(updated({{"feed", Data("a\fc\n"s)}}),
            (std::vector<FileDiff>{{FileDiff::Modified{"feed", {{{2, 1}, {2, 1}, u"b", u"c"}}}}}));
  EXPECT_EQ(updated({{"feed", Data("ab\n"s)}}),
            (std::vector<FileDiff>{{FileDiff::Replaced{"feed", Data("ab\n"s)}}}));
}

TEST_F(UpdatingUserEdits, NamesAFileInOneWay) {
  const Data text("text"s);
  const FileDiff added{FileDiff::Added{"a/b", text}}, other{FileDiff::Added{"a//b/", Data("old"s)}};
  for (const auto& path : {"a/b", "a//b", "a/b/", "a///b//"}) {
    EXPECT_EQ(updated({{path, text}}), std::vector{added}) << path;
    EXPECT_EQ(updated({{path, text}}, {other, added, other}), std::vector{added}) << path;
    EXPECT_TRUE(updated({{path, std::nullopt}}, {other, added, other}).empty()) << path;
  }
}

/// What has no room beside another file of the pack is refused, whichever of the two came first.
TEST_F(UpdatingUserEdits, RefusesFilesThatCollide) {
  const std::optional<Data> text("text"s), edited("one\n2"s);
  const auto added = [](const std::string& path) { return FileDiff{FileDiff::Added{path, Data("old"s)}}; };
  const struct {
    UserEdits edits;
    std::vector<FileDiff> before;
    std::string place;
  } cases[] = {
      {{{"n", text}, {"n/m", text}}, {}, "n"},
      {{{"n/m/o", text}}, {added("n.x"), added("n")}, "n"},
      {{{"n", text}}, {added("n.x"), added("n/m/o")}, "n"},
      {{{"bare", edited}, {"bare.delta", text}}, {}, "bare.delta"},
      {{{"bare.delta/x", text}}, {{FileDiff::Modified{"bare"}}}, "bare.delta"},
      {{{"bare", edited}}, {added("bare.delta")}, "bare.delta"},
      {{{"Manifest.plist", text}}, {}, "Manifest.plist"},
      {{{"Manifest.plist/x", text}}, {}, "Manifest.plist"},
      {{{"a/b", text}, {"a//b", text}}, {}, ""},
      // What is no file of the pack is in nobody's way, and what was there before waits until it is reverted.
      {{{"n/m", text}}, {{FileDiff::Removed{"n"}}}, "room"},
      {{{"n", std::nullopt}}, {added("n"), added("n/m")}, "room"},
      {{{"other", text}}, {added("n"), added("n/m")}, "room"},
      {{{"Manifest", text}, {"bare.delt", text}, {"n", text}, {"n-", text}, {"n.m", text}}, {}, "room"},
  };
  for (const auto& [edits, before, place] : cases) {
    const auto error = errorOf([&, &own = edits, &there = before] { updated(own, there); });
    if (place == "room") {
      EXPECT_FALSE(error) << edits.begin()->first;
      continue;
    }
    ASSERT_TRUE(error) << edits.begin()->first;
    EXPECT_EQ(error->code(), static_cast<int>(DiffErrorCode::CriticalDiffPackValidationError));
    const auto words = ErrorObject(*error).localizedDescription();
    const auto reason = place.empty() ? "edited twice" : "both need \"" + place + "\"";
    EXPECT_NE(words.find(reason), std::string::npos) << words;
  }
}

TEST_F(UpdatingUserEdits, APackIsReadBackBeforeItIsWritten) {
  const auto checked = [&](std::vector<FileDiff> updates) {
    return failure([&] { checkedFileWrapper(packOf(directory_.url(), std::move(updates))); });
  };
  const Data old("old"s), text("text"s);
  EXPECT_EQ(
      checked(
          {{FileDiff::Replaced{"binary", text}}, {FileDiff::Modified{"bare"}}, {FileDiff::Added{"a", old}}}),
      "");
  for (const auto& updates : std::vector<std::vector<FileDiff>>{
           // The first counts, and the last is what would be in the file.
           {{FileDiff::Added{"a", text}}, {FileDiff::Added{"a", old}}},
           // A learner's file that couldn't be read, with the authored one in its place.
           {{FileDiff::Replaced{"bare"}}},
           {{FileDiff::Added{"a", text}}, {FileDiff::Added{"a/b", old}}},
           {{FileDiff::Added{"Manifest.plist", text}}},
           {{FileDiff::Added{"../x", text}}},
           {{FileDiff::Modified{""}}},
       }) {
    EXPECT_TRUE(checked(updates).starts_with("Error(domain: Diff, code: 5, ")) << updates[0].filePath();
  }
}

/// A pack of which nothing can be read goes out of the way, and nothing is ever removed.
TEST(UserEditsPlace, SetsAsideWhatCantBeRead) {
  const TemporaryDirectory directory;
  const auto url = directory.url();
  const auto edits = directory.path() / "Edits";
  EXPECT_EQ(thrown<ErrorObject>([&] {
              goodBook().writeTo(directory.path());
              setUserEditsAside(url);
            }).code(),
            ENOENT);
  for (const auto& name :
       {"UserEdits.aside.diffpack", "UserEdits.aside-2.diffpack", "UserEdits.aside-3.diffpack"}) {
    Tree{{"Edits/UserEdits.diffpack/mine", std::string(name)}}.writeTo(directory.path());
    EXPECT_NE(failure([&] { MarletBookSnapshot(FileWrapper(url), url); }), "");
    EXPECT_NO_THROW(MarletBookSnapshot(withoutUserEdits(FileWrapper(url)), url));
    EXPECT_EQ(setUserEditsAside(url), "Edits/"s + name);
    EXPECT_EQ(FileManager::readFile(directory.url("Edits/"s + name + "/mine")).view(), name);
    EXPECT_NO_THROW(MarletBookSnapshot(FileWrapper(url), url));
  }
  packOf(url).fileWrapper().write(directory.url("Edits/UserEdits.diffpack"));
  EXPECT_EQ(thrown<ErrorObject>([&] { setUserEditsAside(url); }).domain(), DiffErrorDomain);
  EXPECT_TRUE(std::filesystem::exists(edits / "UserEdits.diffpack"));
}

TEST_F(UpdatingUserEdits, TakesThePlaceOfTheFirstEntryOfThatPath) {
  const Data text("text"s);
  const FileDiff first{FileDiff::Removed{"new"}}, other{FileDiff::Removed{"other"}},
      second{FileDiff::Added{"new", Data("old"s)}}, added{FileDiff::Added{"new", text}};
  EXPECT_EQ(updated({{"new", text}}, {first, other, second}), (std::vector{added, other, second}));
  EXPECT_EQ(updated({{"new", std::nullopt}}, {first, other, second}), (std::vector{other, second}));
  EXPECT_EQ(updated({{"none", std::nullopt}}, {first, other}), (std::vector{first, other}));
  EXPECT_EQ(updated({{"page", Data(source)}}, {{FileDiff::Replaced{"page", text}}, other}),
            (std::vector{other}));
}

}  // namespace
}  // namespace MarletFoundation::test
