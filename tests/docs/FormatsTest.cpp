#include <gtest/gtest.h>

#include <set>
#include <span>
#include <tuple>

#include "MarletFoundation/MarletFoundation.h"
#include "docs/FormatPage.h"
#include "support/ChangedHost.h"
#include "support/Failure.h"

namespace MarletFoundation::test {
namespace {

/// What the system says: a user's words, an error object's, or else the name of the case that lies innermost.
std::string wordsOf(const Error& error) {
  const auto* payload = dynamic_cast<const ErrorPayload*>(&error);
  if (payload && dynamic_cast<const ErrorPayload*>(payload->error.get())) return wordsOf(*payload->error);
  if (const auto* visible = dynamic_cast<const UserVisibleError*>(&error))
    return visible->errorContents().localizedRecoverySuggestion;
  return payload ? std::string(error.caseName()) : ErrorObject(error).localizedDescription();
}

Data contents(const TemporaryDirectory& directory, std::string_view file) {
  return FileManager::readFile(directory.url(file));
}

std::string openBook(const TemporaryDirectory& directory) {
  const auto url = directory.url("Tides.marletbook");
  std::optional<DiffPackSnapshot> edits;
  const MarletBookSnapshot book(FileWrapper(url), url, edits);
  for (const auto& chapter : book.chapters) {
    for (const auto& page : chapter.pages)
      snapshotForPageWithFilename(page.filename, chapter.filename, url, &book, edits);
  }
  return "";
}

std::string openPacks(const TemporaryDirectory& directory) {
  for (const auto name : {"UserEdits.diffpack", "Tides.diffpack"})
    DiffPackSnapshot(FileWrapper(directory.url(name)), directory.url(name));
  return "";
}

/// Also what is only logged.
std::string openRecord(const TemporaryDirectory& directory) {
  std::string logged;
  const ChangedHost host([&](HostEnvironment& environment) {
    environment.diagnostics = [](std::string_view) {};
    environment.systemLog = [&](std::string_view entry) { logged = entry; };
  });
  const auto answer = failure([&] {
    MarletResultInfoSnapshot(contents(directory, "ResultInfo.plist"),
                             MarletResultInfoSnapshot::Format::ResultInfo);
  });
  return logged.empty() ? answer : logged.substr(logged.rfind(' ') + 1);
}

std::string openStore(const TemporaryDirectory& directory) {
  MarletKeyValueStoreSnapshot(contents(directory, "KeyValueStore.plist"));
  return "";
}

std::string openTarget(const TemporaryDirectory& directory) {
  return Target::loadFrom(directory.url("wrist.target"), false) ? "" : "nil";
}

std::string openMarlets(const TemporaryDirectory& directory) {
  for (const auto name : {"Tides.marlet", "Old.marlet"})
    MarletSnapshot(FileWrapper(directory.url(name)), directory.url(name));
  return "";
}

struct Format {
  const char* page;
  /// Answers with the words of a failure where they aren't thrown.
  std::string (*open)(const TemporaryDirectory&);
};

std::ostream& operator<<(std::ostream& out, const Format& format) { return out << format.page; }

/// The words in which opening the tree fails; empty when it opens.
std::string answer(const Format& format, const Tree& tree) {
  const TemporaryDirectory directory;
  tree.writeTo(directory.path());
  try {
    return format.open(directory);
  } catch (const Error& error) {
    return wordsOf(error);
  }
}

class Formats : public testing::TestWithParam<Format> {};

}  // namespace

TEST_P(Formats, ExampleOpensAndTablesAreTrue) {
  const FormatPage page(GetParam().page);
  ASSERT_FALSE(page.files.empty());
  ASSERT_FALSE(page.claims.empty());
  EXPECT_EQ(answer(GetParam(), page.example()), "");
  for (const auto& claim : page.claims)
    EXPECT_EQ(answer(GetParam(), claim.changed), claim.answer) << claim.subject;
}

/// A new answer of a loader asks for a place on the page.
TEST(FormatAnswers, StandOnTheirPages) {
  const std::set<std::string_view> neverRaised{"OriginalContentsNotAFile", "assessmentInformationInvalid"};
  const std::tuple<const char*, std::span<const ErrorRow>> answers[] = {
      {"book.md", errorTable(MarletBookSnapshot::SerializationErrorCase{}).rows},
      {"book.md", errorTable(MarletChapterSnapshot::SerializationErrorCase{}).rows},
      {"book.md", errorTable(MarletBookPageSnapshot::SerializationErrorCase{}).rows},
      {"book.md", errorTable(CutsceneBookPageSnapshot::SerializationErrorCase{}).rows},
      {"result-info.md", errorTable(MarletResultInfoSnapshot::SerializationErrorCase{}).rows},
      {"result-info.md", errorTable(MarletInlineResultData::SerializationErrorCase{}).rows},
      {"key-value-store.md", errorTable(MarletKeyValueStoreSnapshot::SerializationErrorCase{}).rows},
      {"classic.md", errorTable(MarletSnapshot::SerializationErrorCase{}).rows},
  };
  for (const auto& [page, rows] : answers) {
    auto text = FormatPage(page).text;
    std::replace(text.begin(), text.end(), '\n', ' ');
    for (const auto& row : rows) {
      const auto words = row.recoverySuggestion.substr(0, row.recoverySuggestion.find('{'));
      if (neverRaised.contains(row.name)) continue;
      EXPECT_NE(text.find(row.recoverySuggestion.empty() ? row.name : words), std::string::npos) << row.name;
    }
  }
}

INSTANTIATE_TEST_SUITE_P(, Formats,
                         testing::Values(Format{"book.md", openBook}, Format{"diff-pack.md", openPacks},
                                         Format{"result-info.md", openRecord},
                                         Format{"key-value-store.md", openStore},
                                         Format{"target.md", openTarget}, Format{"classic.md", openMarlets}),
                         [](const auto& format) {
                           std::string name = format.param.page;
                           name.resize(name.size() - 3);
                           std::erase(name, '-');
                           return name;
                         });

/// The update goes into the book under the learner's edits.
TEST(FormatExamples, DiffPack) {
  const TemporaryDirectory directory;
  const FormatPage packs("diff-pack.md");
  FormatPage("book.md").example().writeTo(directory.path());
  packs.example().writeTo(directory.path());
  packs.example().writeTo(directory.path() / "Tides.marletbook/Edits");
  const auto book = directory.url("Tides.marletbook"), update = directory.url("Tides.diffpack");
  applyUpdateDiffPack(book, DiffPackSnapshot(FileWrapper(update), update));
  std::optional<DiffPackSnapshot> edits;
  EXPECT_EQ(MarletBookSnapshot(FileWrapper(book), book, edits).contentVersion.versionString(), "1.0.1");
  ASSERT_TRUE(edits);
  EXPECT_EQ(edits->baseVersion, "1.0.1");
  const auto text = mergedUserEdit(*edits, "Chapters/Moon/Pages/Pull.marletpage/Contents.swift").value();
  EXPECT_NE(text.view().find("= 12.42\n"), std::string_view::npos);
  EXPECT_NE(text.view().find("let tides = 2\n"), std::string_view::npos);
  EXPECT_EQ(contents(directory,
                     "Tides.marletbook/Contents/Chapters/Moon/Pages/Sea.cutscenepage/Resources/Beach.svg"),
            contents(directory, "Tides.diffpack/Chapters/Moon/Pages/Sea.cutscenepage/Resources/Beach.svg"));
}

TEST(FormatExamples, ResultInfo) {
  using Record = MarletInlineResultData;
  const TemporaryDirectory directory;
  FormatPage("result-info.md").example().writeTo(directory.path());
  const MarletResultInfoSnapshot info(contents(directory, "ResultInfo.plist"),
                                      MarletResultInfoSnapshot::Format::ResultInfo);
  const AssessmentStatus failed(AssessmentStatus::Fail{{"Count the tides of one day."}, "let tides = 2"});
  EXPECT_EQ(info.assessmentInformation(), AssessmentInformation(failed, true));
  const Record::VisibleState graph = Record::Visible{Record::AtMost{240, 120.5}, Record::DisplayMode::graph};
  const InlineResults results{{3, Record(3, 0, graph)}, {5, Record(5, 0, Record::Hidden{})}};
  EXPECT_EQ(info.inlineResults(), results);
  const MarletResultInfoSnapshot timeline(contents(directory, "Timeline.xml"),
                                          MarletResultInfoSnapshot::Format::LegacyInlineResultsTimeline);
  const Record::VisibleState small = Record::Visible{Record::AtMost{240, 120}, Record::DisplayMode::graph};
  EXPECT_EQ(timeline.inlineResults(), (InlineResults{{3, Record(3, 12, small)}}));
}

}  // namespace MarletFoundation::test
