#include <gtest/gtest.h>

#include "MarletFoundation/MarletFoundation.h"
#include "docs/FormatPage.h"

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
  const auto former = HostEnvironment::current();
  auto environment = former;
  std::string logged;
  environment.diagnostics = [](std::string_view) {};
  environment.systemLog = [&](std::string_view entry) { logged = entry; };
  HostEnvironment::setCurrent(environment);
  std::string answer;
  try {
    MarletResultInfoSnapshot(contents(directory, "ResultInfo.plist"),
                             MarletResultInfoSnapshot::Format::ResultInfo);
    if (!logged.empty()) answer = logged.substr(logged.rfind(' ') + 1);
  } catch (const Error& error) {
    answer = error.description();
  }
  HostEnvironment::setCurrent(former);
  return answer;
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

}  // namespace MarletFoundation::test
