#include <gtest/gtest.h>
#include <rapidcheck.h>

#include "MarletFoundation/Marlet/CutsceneBookPage.h"
#include "MarletFoundation/Marlet/Marlet.h"
#include "MarletFoundation/Marlet/MarletBook.h"
#include "MarletFoundation/Marlet/MarletBookPage.h"
#include "MarletFoundation/Marlet/MarletPage.h"
#include "MarletFoundation/Platform/HostEnvironment.h"
#include "MarletFoundation/Platform/Text.h"
#include "support/ChangedHost.h"
#include "support/Documents.h"
#include "support/Failure.h"
#include "support/Fatal.h"
#include "support/Tree.h"

namespace MarletFoundation::test {
namespace {

const URL baseURL = URL::file("/books/Loops.marletbook", true);
const std::string book = "Contents/Manifest.plist";

std::string text() {
  return *rc::gen::container<std::string>(rc::gen::oneOf(rc::gen::inRange('\n', '~'), rc::gen::just('"')));
}
std::optional<std::string> optionalText() {
  return *rc::gen::arbitrary<bool>() ? std::optional(text()) : std::nullopt;
}

/// With resources, a hint may be the file that lies in them.
MarletHint hint(bool hasResources) {
  const auto title = optionalText();
  const auto inlined = MarletHint::ContentType(MarletHint::Contents{text()});
  return {
      hasResources && *rc::gen::arbitrary<bool>() ? MarletHint::FileReference{"Count.", "hint.md"} : inlined,
      title ? MarletHint::PresentationType(MarletHint::HiddenWithSpoilerInstruction{*title})
            : MarletHint::AlwaysVisible{}};
}

MarletResultInfoSnapshot resultInfo() {
  InlineResults results;
  for (const auto line : *rc::gen::container<std::vector<std::int64_t>>(rc::gen::arbitrary<std::int64_t>()))
    results.emplace(line / 2, MarletInlineResultData(line / 2, 0, MarletInlineResultData::Hidden{}));
  std::optional<AssessmentInformation> assessment;
  if (*rc::gen::arbitrary<bool>()) {
    assessment.emplace(AssessmentStatus(AssessmentStatus::Fail{{text()}, optionalText()}),
                       *rc::gen::arbitrary<bool>());
  }
  return {assessment, results};
}

/// What a page's URLs lead to.
const Tree pageFiles{{"Sources/Turtle.swift", "// steps"},
                     {"Resources/hint.md", "Count."},
                     {"Resources/scene.html", "<p>"},
                     {"LiveView.swift", "// sea"}};

MarletBookPageSnapshot page(const URL& url) {
  const auto maybe = [&](const char* name, bool isDirectory) {
    return *rc::gen::arbitrary<bool>() ? std::optional(url.appendingPathComponent(name, isDirectory))
                                       : std::nullopt;
  };
  const auto resources = maybe("Resources", true);
  const auto mode = *rc::gen::element(LiveViewMode::HiddenByDefault, LiveViewMode::VisibleByDefault);
  const auto logging = *rc::gen::element(MarletLoggingMode::Normal, MarletLoggingMode::Off);
  std::vector<MarletHint> hints;
  for (int count = *rc::gen::inRange(0, 4); count > 0; --count) hints.push_back(hint(resources.has_value()));
  return {text(),
          optionalText(),
          resources ? optionalText() : std::nullopt,
          url.lastPathComponent(),
          *utf16FromUTF8(text() + "🌊"),
          resultInfo(),
          maybe("Sources", true),
          resources,
          maybe("LiveView.swift", false),
          mode,
          *rc::gen::arbitrary<bool>(),
          optionalText(),
          logging,
          hints};
}

}  // namespace

TEST(LivePage, ReadOfAWriteIsThePage) {
  const TemporaryDirectory directory;
  pageFiles.writeTo(directory.path());
  const auto url = directory.url();
  const ChangedHost silent([](HostEnvironment& host) { host.diagnostics = [](std::string_view) {}; });
  EXPECT_TRUE(rc::check("read . write = id", [&] {
    const auto snapshot = page(url);
    RC_ASSERT(MarletBookPageSnapshot(snapshot.fileWrapper(), url, std::nullopt) == snapshot);
    RC_ASSERT(MarletBookPage(snapshot).snapshot() == snapshot);
  }));
  EXPECT_TRUE(rc::check("read . write = id, for cutscenes", [&] {
    const CutsceneBookPageSnapshot snapshot(text(), url.lastPathComponent(), "scene.html", optionalText(),
                                            optionalText(), url.appendingPathComponent("Resources", true),
                                            optionalText());
    RC_ASSERT(CutsceneBookPageSnapshot(snapshot.fileWrapper(), url) == snapshot);
    RC_ASSERT(CutsceneBookPage(snapshot).snapshot() == snapshot);
  }));
}

TEST(LivePage, EditsDontShowInASnapshotAlreadyTaken) {
  const MarletBookPageSnapshot original("N", {}, {}, "N.marletpage", u"one", {}, {}, {}, {}, {}, true, {}, {},
                                        {});
  const auto converted = original.convertToMutablePage();
  auto& live = dynamic_cast<MarletBookPage&>(*converted);
  const auto before = static_cast<const PageType&>(live).snapshot();
  static_cast<const MarletPageType&>(live).contents().left()->get() += u" two";
  live.resultInfo().trackInlineResultDataAt(3, 0);
  live.setName("M");
  EXPECT_TRUE(dynamic_cast<const MarletBookPageSnapshot&>(*before) == original);
  EXPECT_EQ(before->name(), "N");
  const auto after = live.snapshot();
  EXPECT_EQ(after.name(), "M");
  EXPECT_EQ(after.contents().right()->get(), u"one two");
  EXPECT_EQ(after.resultInfo().inlineResults().size(), 1u);
  EXPECT_FALSE(live.passed());
  live.resultInfo().updateAssessmentInformation(AssessmentInformation(AssessmentStatus::Fail{}, true));
  EXPECT_TRUE(live.passed());
}

TEST(LivePage, KeepsTheRecordOfItsHost) {
  struct Counting : MarletResultInfo {
    int runs = 0;
    void executionDidBegin() override {
      ++runs;
      MarletResultInfo::executionDidBegin();
    }
  };
  const auto record = std::make_shared<Counting>();
  const auto bookPage = [](std::shared_ptr<MarletResultInfo> r) {
    return std::make_unique<MarletBookPage>("N", std::nullopt, std::nullopt, "N.marletpage", u"",
                                            std::move(r), std::nullopt, std::nullopt, std::nullopt,
                                            LiveViewMode::HiddenByDefault, true, std::nullopt,
                                            MarletLoggingMode::Normal, std::vector<MarletHint>());
  };
  const auto classicPage = [](std::shared_ptr<MarletResultInfo> r) {
    return std::make_unique<MarletPage>("N", u"", std::move(r), std::nullopt, std::nullopt,
                                        std::vector<MarletHint>());
  };
  const auto check = [&](const MutableMarletPageType& page, const auto& snapshotOf) {
    page.resultInfo().executionDidBegin();
    record->trackInlineResultDataAt(record->runs, 0);
    EXPECT_EQ(snapshotOf().resultInfo().inlineResults(), record->inlineResults());
  };
  const auto first = bookPage(record);
  const auto second = classicPage(record);
  check(*first, [&] { return first->snapshot(); });
  check(*second, [&] { return second->snapshot(); });
  EXPECT_EQ(record->runs, 2);
  EXPECT_EQ(fatalMessage([&] { bookPage(nullptr); }), "A page must have a record of results!");
  EXPECT_EQ(fatalMessage([&] { classicPage(nullptr); }), "A page must have a record of results!");
}

TEST(LiveBook, SnapshotOfALiveBookIsTheBook) {
  const MarletBookSnapshot snapshot(goodBook().wrapper(), baseURL);
  MarletBook live(snapshot);
  const auto again = live.snapshot();
  EXPECT_EQ(again.manifest(), snapshot.manifest());
  EXPECT_EQ(again.uniquifier, snapshot.uniquifier);
  EXPECT_EQ(again.sourcesDirectoryURL, snapshot.sourcesDirectoryURL);
  EXPECT_EQ(again.resourcesDirectoryURL, snapshot.resourcesDirectoryURL);
  EXPECT_EQ(again.userResourcesDirectoryURL, snapshot.userResourcesDirectoryURL);
  EXPECT_EQ(again.keyValueStore.contents(), snapshot.keyValueStore.contents());
  ASSERT_EQ(again.chapters.size(), 2u);
  EXPECT_EQ(again.chapters[0].manifest(), snapshot.chapters[0].manifest());
  EXPECT_EQ(again.chapters[0].resourcesDirectoryURL, snapshot.chapters[0].resourcesDirectoryURL);
  EXPECT_EQ(again.chapters[0].pages[0].pageDescription, "Page A");
  EXPECT_EQ(again.chapters[0].pages[0].resultInfoSnapshot, snapshot.chapters[0].pages[0].resultInfoSnapshot);

  live.chapters[0]->pages[0]->resultInfoSnapshot.reset();
  live.chapters[1]->name = "Zwei";
  EXPECT_TRUE(again.chapters[0].pages[0].resultInfoSnapshot);
  EXPECT_EQ(live.snapshot().chapters[1].name, "Zwei");
  live.chapters.clear();
  EXPECT_EQ(*live.snapshot().manifest().dictionary()->find("Chapters"),
            PropertyListValue(PropertyListValue::Array{}));
}

TEST(LiveBook, NullPartsAreStatedFatalErrors) {
  const auto live = [] {
    return std::make_unique<MarletBook>(MarletBookSnapshot(goodBook().wrapper(), baseURL));
  };
  const auto withoutTarget = live(), withoutChapter = live(), withoutPage = live();
  withoutTarget->target = nullptr;
  withoutChapter->chapters[1] = nullptr;
  withoutPage->chapters[1]->pages[0] = nullptr;
  const auto classic = [](TargetPointer target, bool hasPage) {
    Marlet::Pages pages;
    pages.push_back(hasPage ? std::make_unique<MarletPage>(MarletPageSnapshot("P", u"", {}, {}, {}, {}))
                            : nullptr);
    Marlet("N", "U", std::move(target), true, {}, {}, {}, std::move(pages), MarletKeyValueStore())
        .snapshot()
        .fileWrapper();
  };
  const std::pair<std::function<void()>, const char*> cases[] = {
      {[&] { withoutTarget->snapshot().manifest(); }, "A book can't be written without a target."},
      {[&] { withoutChapter->snapshot(); }, "A book's chapters can't be null."},
      {[&] { withoutPage->snapshot(); }, "A chapter's pages can't be null."},
      {[&] { classic(nullptr, true); }, "A marlet can't be written without a target."},
      {[&] { classic(withoutPage->target, false); }, "A marlet's pages can't be null."},
      {[] { Target::registerTarget(nullptr, std::nullopt); }, "A null target can't be registered."},
  };
  for (const auto& [use, message] : cases) EXPECT_EQ(fatalMessage(use), message);
}

TEST(LiveBook, PropertiesOfABookThatNeedNotOpen) {
  const TemporaryDirectory directory;
  const auto read = [&](const Tree& tree) {
    std::filesystem::remove_all(directory.path() / "B");
    tree.writeTo(directory.path() / "B");
    return failure([&] { MarletBook::propertiesOfBookAtURL(directory.url("B")); });
  };
  const auto good = goodBook().withKey(book, "Version", 7).withKey(book, "ImageReference", 7);
  EXPECT_EQ(read(good), "");
  const auto properties = MarletBook::propertiesOfBookAtURL(directory.url("B"));
  EXPECT_EQ(properties.name, "Loops");
  EXPECT_EQ(properties.bookDescription, "All of them");
  EXPECT_EQ(properties.contentIdentifier, "org.example.loops");
  EXPECT_EQ(properties.contentVersion, Version({1, 2}));
  EXPECT_EQ(properties.imageReference, std::nullopt);
  EXPECT_EQ(properties.resourcesDirectoryURL->path(), directory.url("B/Contents/Resources").path());

  EXPECT_EQ(read(good.without(book)), "missingManifest");
  EXPECT_EQ(read(good.with(book, PropertyListValue(PropertyListValue::Array{}))), "missingManifest");
  EXPECT_EQ(read(good.withKey(book, "Name", 7).withKey(book, "ContentIdentifier", 7)), "missingName");
  EXPECT_EQ(read(good.withKey(book, "ContentIdentifier", 7)), "missingContentIdentifier");
  EXPECT_EQ(read(good.withKey(book, "ContentVersion", 1.5)), "missingContentVersion");
  EXPECT_EQ(read(good.withKey(book, "ContentVersion", "1.x")), "invalidContentVersion(\"1.x\")");
  read(good.without("Contents/Resources"));
  EXPECT_FALSE(MarletBook::propertiesOfBookAtURL(directory.url("B")).resourcesDirectoryURL);
}

}  // namespace MarletFoundation::test
